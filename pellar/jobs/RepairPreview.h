// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/disks/DiskClaim.h"
#include "pellar/jobs/Job.h"
#include "pellar/outcome/Outcome.h"
#include "pellar/overlay/TrialDisk.h"
#include "pellar/tools/Tool.h"

#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace pellar {

/// Tells what a repair has come to where it was tried, which is not brought to the disk. The job's
/// thread; the references outlive it.
class RepairPreview {
public:
    /// `disk` is what the trial began with, as it still is.
    RepairPreview(JobContext& context, const Tool& tool, const TrialDisk& trial,
                  const DiskClaim& disk)
        : context_(context), tool_(tool), trial_(trial), disk_(disk)
    {
    }

    /// Answers what a verification with that knowledge would: damaged, and whether the repair
    /// makes it sound.
    [[nodiscard]] Outcome tell(const Outcome& tried, const FileCounts& counts);

private:
    void tellChanges(const std::vector<ByteRange>& ranges, const Outcome& tried,
                     const FileCounts& counts);
    void tellFiles(const std::vector<ByteRange>& ranges, const FileCounts& counts);
    void nameFiles(std::vector<FileChange>& files);
    void tellCollected();
    /// NO when the program is missing, or did not end well.
    bool runListing(std::string_view program, std::vector<std::string> arguments, int disk,
                    RunListener& listing);
    [[nodiscard]] std::optional<Sentence> writeImage();

    JobContext& context_;
    JobLog& log_ = context_.log;
    const Tool& tool_;
    const TrialDisk& trial_;
    const DiskClaim& disk_;
};

}  // namespace pellar
