// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/outcome/Judgement.h"
#include "pellar/outcome/Task.h"
#include "pellar/process/Command.h"
#include "pellar/process/ProcessRunner.h"
#include "pellar/tools/FileComparison.h"
#include "pellar/tools/ToolOutput.h"
#include "pellar/tools/VolumeFacts.h"

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace pellar {

/// All that is known about a run when it is judged.
struct RunEvidence {
    Access access = Access::ReadOnly;
    RunResult result;
    Findings findings;
    VolumeFacts volume;
};

/// In what tools differ besides the disks that they treat.
struct ToolHabits {
    /// It finds a volume inside a larger file or disk when it is told where.
    bool takesOffset = false;
    /// It holds its output back unless it writes to a terminal.
    bool wantsTerminal = true;
    /// Its repair replays a journal first.
    bool replaysInRepair = false;
    /// Asked to end in the middle of a repair, it leaves the disk in order.
    bool endsInOrder = false;
    /// A log that waits is brought to its place by mounting, as this file system; empty: the tool
    /// does it, or there is no log.
    std::string_view logReplayedAs = {};
    /// Where a repair collects files that have lost their names: for one of them, and for many.
    std::string_view collectedOne = "no damage is left; %1$@ file is now in lost+found";
    std::string_view collectedMany = "no damage is left; %1$@ files are now in lost+found";
};

/// How a tool reads a log that waits to be replayed, which its verification passes over: by the
/// places of its parts. What is not damage is not told.
struct LogReading {
    std::vector<std::string> (*arguments)(const std::vector<std::uint64_t>& parts,
                                          const std::string& disk);
    std::unique_ptr<OutputReader> (*makeReader)();
};

/// A file to which a repair gave a name of its own.
struct CollectedFile {
    std::string name;  ///< any bytes
    std::uint64_t bytes = 0;
};

/// How the directory is listed in which a repair collects files that have lost their names.
struct CollectedFilesReading {
    std::string_view program;
    std::vector<std::string> (*arguments)(const std::string& disk);
    /// Of a line of what it prints.
    std::optional<CollectedFile> (*fileIn)(std::string_view line);
};

/// How a tool is asked for its version, where no disk is to be looked at.
struct VersionQuestion {
    std::vector<std::string> arguments = {};  ///< none: it cannot be asked
    std::string_view banner = {};             ///< what stands before it in the answer
};

/// A checking tool: what it can do, how it is called, how it answers. The functions keep nothing;
/// any thread.
struct Tool {
    std::string_view name;        ///< of the executable that verifies
    std::string_view repairName;  ///< of the executable that repairs
    std::string_view package;     ///< the Debian package that brings them
    /// Why it is not let repair a disk without a trial before; empty where it is.
    Sentence reasonAgainstDirectRepair = {};
    ToolHabits habits = {};
    /// What stands before its version in one of its first lines; empty where it does not say it.
    std::string_view banner = {};
    VersionQuestion version = {};

    /// Reads the disk a little; never writes.
    VolumeFacts (*examine)(int disk, std::uint64_t offset, std::uint64_t availableBytes);
    /// `disk` is a name that the tool can open; `offset` is where in it the volume starts, bytes.
    std::vector<std::string> (*arguments)(Access access, const std::string& disk,
                                          std::uint64_t offset);
    std::unique_ptr<OutputReader> (*makeReader)();
    /// Of a line from the progress descriptor. From 0 to 100, of one run; none when the line is no
    /// progress report.
    std::optional<double> (*percentOf)(std::string_view line) = [](std::string_view) {
        return std::optional<double>();
    };
    Judgement (*judge)(const RunEvidence& evidence);
    /// Null where a verification leaves nothing out of a log, or no tool can read it.
    const LogReading* logReading = nullptr;
    /// Null where no tool can list it.
    const CollectedFilesReading* collectedFiles = nullptr;
    /// Null where we cannot read them.
    const FileComparison* files = nullptr;

    bool repairs(RepairWay way) const
    {
        return way == RepairWay::TriedFirst || reasonAgainstDirectRepair.isEmpty();
    }
};

}  // namespace pellar
