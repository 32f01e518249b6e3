// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/ManagerOptions.h"
#include "pellar/disks/DiskClaim.h"
#include "pellar/jobs/JobLog.h"
#include "pellar/tools/Tool.h"

#include <filesystem>
#include <memory>
#include <vector>

namespace pellar {

/// What every run of a job uses; the references outlive it.
struct RunSurroundings {
    const ManagerOptions& options;
    JobLog& log;
    EventRoad& road;
    StopSwitch& stop;
};

/// One run of a tool: starts it, passes its lines and progress on to the log as they come, and
/// gathers what they say.
class ToolRun final : private RunListener {
public:
    /// How the problems are shown that it tells of: as such, or, where the run before has shown
    /// them, or the one behind it will, among the details.
    enum class Problems { Shown, Kept };

    ToolRun(const Tool& tool, std::filesystem::path program, Access access, Problems problems,
            RunSurroundings surroundings);

    /// Runs the tool to its end. `volume` is what was seen of the disk before.
    [[nodiscard]] RunEvidence run(const DiskForTool& disk, const VolumeFacts& volume);

private:
    RunRequest requestFor(const DiskForTool& disk) const;
    bool isUnstoppable() const;
    void endIfUnreadable();
    void tellEndOf(const RunResult& result);
    void tellToolLines();
    contract::Name stepType() const;

    void line(std::string_view line, bool isCut) override;
    void progressLine(std::string_view line) override;
    void lineLimitReached() override;
    void stopAsked() override;
    void pause() override { surroundings_.road.flush(); }
    void tick() override { surroundings_.road.flushIfDue(); }

    const Tool& tool_;
    std::filesystem::path program_;
    Access access_;
    Problems problems_;
    RunSurroundings surroundings_;
    std::unique_ptr<OutputReader> reader_;
    std::vector<ToolLine> lines_;
    bool isEnded_ = false;  ///< by us, because of the disk
};

}  // namespace pellar
