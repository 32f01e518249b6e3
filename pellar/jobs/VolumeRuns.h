// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/jobs/JobDisk.h"
#include "pellar/jobs/ToolRun.h"
#include "pellar/overlay/TrialDisk.h"
#include "pellar/tools/Tool.h"

#include <filesystem>
#include <optional>
#include <vector>

namespace pellar {

/// Runs the tool of a volume, on the disk itself or where a repair is tried, and judges what it
/// said. The job's thread; the references outlive it.
class VolumeRuns {
public:
    /// The disk is taken before the tool is chosen.
    VolumeRuns(const JobDisk& disk, JobContext& context) : disk_(disk), context_(context) {}

    /// Finds its programs, and looks at the volume.
    void choose(const Tool& tool);
    /// Of what follows, until it is called again; the disk itself for null.
    void workOn(const TrialDisk* trial) { trial_ = trial; }

    // Once a tool is chosen.

    const Tool& tool() const { return *tool_; }
    /// What was seen of it before the last run.
    const VolumeFacts& volume() const { return volume_; }
    const std::filesystem::path& program(Access access) const
    {
        return access == Access::ReadOnly ? program_ : repairProgram_;
    }

    RunEvidence run(Access access, ToolRun::Problems problems);
    Judgement judge(const RunEvidence& evidence) const;
    /// The same of a verification, after a log that waits was read as well, where the tool passes
    /// over it.
    Judgement judgeWithLog(RunEvidence evidence);
    /// The kernel brings a log that waits to its place (ToolHabits::logReplayedAs); 0 or an errno.
    int replayLog();

    /// The first byte of these pieces of the disk that cannot be read; as much as half a minute of
    /// reading shows.
    std::optional<std::uint64_t> firstUnreadable(const std::vector<ByteRange>& pieces) const;
    /// The same of where a tool could not read and where a file system keeps what it is built on;
    /// of all, where a tool could not read and does not say where.
    std::optional<std::uint64_t> unreadableByte(const ReadFault& fault) const;

private:
    VolumeFacts facts() const;
    Result<DiskForTool, int> prepare(DiskForTool::Form form, Access access);
    Result<DiskForTool, int> prepareView();
    RunEvidence runOn(Access access, ToolRun::Problems problems,
                      const std::vector<std::uint64_t>& logParts);
    Judgement asKernelSays(const Judgement& judgement, const RunEvidence& evidence) const;

    const JobDisk& disk_;
    JobContext& context_;
    const TrialDisk* trial_ = nullptr;
    std::optional<TrialDisk> view_;  ///< of a part of a disk, for a tool that reads it alone
    const Tool* tool_ = nullptr;
    std::filesystem::path program_;
    std::filesystem::path repairProgram_;
    VolumeFacts volume_;
    std::optional<Judgement> obstacle_;  ///< why the last run could not even be prepared
};

}  // namespace pellar
