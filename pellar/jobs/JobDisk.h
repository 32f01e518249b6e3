// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/disks/DiskClaim.h"
#include "pellar/jobs/JobLog.h"
#include "pellar/mounts/UnmountedDisk.h"
#include "pellar/outcome/Outcome.h"
#include "pellar/process/Command.h"

#include <optional>
#include <vector>

namespace pellar {

/// The disk of a job on a volume: the job has it to itself, unmounted before where it was mounted,
/// from `take` to `giveBack`. The job's thread; the references outlive it.
class JobDisk {
public:
    /// `claim` is there when the disk was at rest and free as the job began; else `mounts` tells
    /// where it is mounted.
    JobDisk(contract::DiskReferencePointer disk, std::optional<DiskClaim> claim,
            std::vector<Mount> mounts, const SystemPaths& paths, JobLog& log);

    /// Why it cannot be had, and then nothing is changed; none when it is the job's. May take long.
    [[nodiscard]] std::optional<Outcome> take(Access access);
    /// Mounts it again where it was; says what could not be. Nothing happens the second time.
    void giveBack();

    /// What it is listed as.
    const contract::DiskReference& reference() const { return *disk_; }
    /// Between `take` and `giveBack`.
    const DiskClaim& claim() const { return *claim_; }

private:
    std::optional<Outcome> unmount();

    const contract::DiskReferencePointer disk_;
    std::optional<DiskClaim> claim_;
    std::vector<Mount> mounts_;
    std::optional<UnmountedDisk> unmounted_;
    const SystemPaths& paths_;
    JobLog& log_;
};

}  // namespace pellar
