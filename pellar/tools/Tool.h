// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/disks/Readability.h"
#include "pellar/process/Access.h"
#include "pellar/process/ProcessRunner.h"
#include "pellar/outcome/Damage.h"
#include "pellar/outcome/Judgement.h"

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace pellar {

/// One line of a tool, told apart.
struct ToolLine {
    enum class Kind {
        Phase,     ///< a new step begins
        Problem,   ///< something is wrong with the disk, or with the check
        Detail,    ///< anything else
        Progress,  ///< how far the run has come, and nothing to be shown as a line
    };

    Kind kind = Kind::Detail;
    std::string text;
    /// For a phase that is known: its English text, a literal.
    std::string_view phaseKey;
    double percent = 0;  ///< of a progress line, of this run

    friend bool operator==(const ToolLine&, const ToolLine&) = default;
};

/// What a tool could not read.
struct ReadFault {
    std::optional<std::uint64_t> byte;   ///< from the volume's start, where that is said
    std::optional<std::uint64_t> block;  ///< or this, of `VolumeFacts::blockBytes`
    /// It does not say whether the disk failed it or it looked in a wrong place; the kernel knows.
    bool isUnproven = false;

    friend bool operator==(const ReadFault&, const ReadFault&) = default;
};

/// What the lines of one run say together.
struct Findings {
    std::uint64_t problems = 0;     ///< problem lines
    Damage damage;                  ///< what they mean together
    std::uint64_t corrections = 0;  ///< of these, answered with yes
    bool isComplete = false;        ///< the line that ends a full run was printed
    bool wasModified = false;
    bool hasErrorsLeft = false;  ///< the tool says so itself
    bool skippedJournal = false;
    bool replayedJournal = false;
    bool lacksExternalJournal = false;
    bool lacksOtherDisk = false;  ///< a part of the volume is on a disk that was not found
    bool foundDiskInUse = false;
    bool expectsDifference = false;  ///< in what is no damage, and so no matter of its exit status
    int crashSignal = 0;             ///< caught by the tool itself; 0 for none
    std::optional<ReadFault> readFault;  ///< the first
    std::optional<std::uint64_t> files;  ///< that it counted, where it says so at its end
    std::uint64_t reconnected = 0;       ///< files that it gave a new name, as they had none
    std::uint64_t cleared = 0;           ///< files and names that it did away with

    friend bool operator==(const Findings&, const Findings&) = default;
};

/// Reads the lines of one run. Pure but for what it remembers of the lines before.
class OutputReader {
public:
    virtual ~OutputReader() = default;

    /// Appends what is known by now: none, one or several lines, in the tool's order.
    virtual void read(std::string_view line, std::vector<ToolLine>& lines) = 0;
    /// The run has ended.
    virtual void finish(std::vector<ToolLine>& lines) = 0;
    virtual const Findings& findings() const = 0;
};

/// What we have seen of a volume ourselves.
struct VolumeFacts {
    bool isRecognized = false;  ///< it is of a kind that the tool treats
    bool hasPrimary = false;    ///< the main superblock is in its place
    bool isForeign = false;     ///< something else claims the place: nothing may be written
    bool needsRecovery = false;
    bool isMarkedDirty = false;     ///< it says itself that it was not properly unmounted
    std::uint64_t volumeBytes = 0;  ///< 0 when not known
    std::uint64_t availableBytes = 0;
    std::uint64_t blockBytes = 0;  ///< of the blocks that its tool counts in; 0 when it does not
    bool differsFromBackup =
        false;  ///< the two copies of the main superblock contradict each other
    std::optional<std::uint64_t> files;  ///< by its own books, where these agree with each other
    std::vector<DiskPiece> backups;      ///< what a repair uses and a verification does not read

    bool isCutShort() const { return volumeBytes > availableBytes; }
};

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

/// For `Tool::makeReader`.
template <class Output>
std::unique_ptr<OutputReader> readerFor()
{
    return std::make_unique<Output>();
}

/// A checking tool: what it can do, how it is called, how it answers. The functions keep nothing;
/// any thread.
struct Tool {
    std::string_view name;        ///< of the executable that verifies
    std::string_view repairName;  ///< of the executable that repairs
    std::string_view package;     ///< the Debian package that brings them
    /// Why it does not repair; empty where it does.
    Sentence reasonAgainstRepair = {};
    ToolHabits habits = {};

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

    bool canRepair() const { return reasonAgainstRepair.isEmpty(); }
};

}  // namespace pellar
