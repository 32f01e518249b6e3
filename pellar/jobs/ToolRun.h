// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/disks/DiskClaim.h"
#include "pellar/jobs/Job.h"
#include "pellar/tools/Tool.h"

#include <filesystem>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

namespace pellar {

/// The name under which a tool opens the disk that it inherits. No name of the user's ever
/// stands in a command.
std::string diskArgumentOfTool();

/// A tool's line with that name, and the offset that may follow it, replaced by the disk's own.
std::string withDiskName(std::string_view line, std::string_view diskName);

/// One run of a tool: starts it, passes its lines and progress on to the log as they come, and
/// gathers what they say.
class ToolRun final : private RunListener {
public:
    /// How the problems are shown that it tells of: as such, or, where the run before has shown
    /// them, or the one behind it will, among the details.
    enum class Problems { Shown, Kept };

    ToolRun(const Tool& tool, std::filesystem::path program, Access access, Problems problems,
            JobContext& context);

    /// It is to read these parts of a log (Tool::logReading) instead of verifying.
    void readLog(std::vector<std::uint64_t> parts);

    /// Runs the tool to its end. `volume` is what was seen of the disk before.
    [[nodiscard]] RunEvidence run(const DiskForTool& disk, const VolumeFacts& volume);

private:
    RunRequest requestFor(const DiskForTool& disk) const;
    bool isUnstoppable() const;
    void nameTool(std::string_view line);
    void endIfUnreadable();
    void tellEndOf(const RunResult& result);
    void tellToolLines();
    Operation operation() const;
    Sentence aboutTool(std::string_view key) const { return {key, program_.filename(), {}}; }

    void line(std::string_view line, bool isCut) override;
    void progressLine(std::string_view line) override;
    void lineLimitReached() override;
    void stopAsked() override;
    void pause() override { context_.log.flush(); }
    void tick() override { context_.log.flushIfDue(); }

    const Tool& tool_;
    std::filesystem::path program_;
    Access access_;
    Problems problems_;
    JobContext& context_;
    std::unique_ptr<OutputReader> reader_;
    std::vector<ToolLine> lines_;
    std::vector<std::uint64_t> logParts_;
    bool namesTool_ = false;  ///< its name is the job's, and its version is not known yet
    bool isEnded_ = false;    ///< by us, because of the disk
};

}  // namespace pellar
