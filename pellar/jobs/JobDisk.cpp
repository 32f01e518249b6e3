// SPDX-License-Identifier: Apache-2.0
#include "pellar/jobs/JobDisk.h"

#include "contract/pellar/MessageKeys.h"

#include <utility>

namespace pellar {

JobDisk::JobDisk(contract::DiskReferencePointer disk, std::optional<DiskClaim> claim,
                 std::vector<Mount> mounts, const SystemPaths& paths, JobLog& log)
    : disk_(std::move(disk)),
      claim_(std::move(claim)),
      mounts_(std::move(mounts)),
      paths_(paths),
      log_(log)
{
}

std::optional<Outcome> JobDisk::take(Access access)
{
    if (claim_)
        return std::nullopt;
    if (!mounts_.empty())
        if (auto refusal = unmount())
            return refusal;
    auto claim = DiskClaim::take(*disk_, access, paths_);
    if (!claim)
        return failedOutcome(claim.error(),
                             {unmounted_ ? "it was unmounted, but could not be opened"
                                         : "another program has it to itself",
                              {},
                              {}});
    claim_.emplace(*std::move(claim));
    return std::nullopt;
}

std::optional<Outcome> JobDisk::unmount()
{
    log_.step(Operation::Verify, {"Unmounting “%1$@”", log_.diskName(), {}});
    log_.flush();  // what is still to be written may take long
    auto unmounted = UnmountedDisk::take(std::move(mounts_), paths_);
    if (!unmounted)
        return failedOutcome(contract::kPLErrorCouldNotUnmount, unmounted.error());
    unmounted_.emplace(*std::move(unmounted));
    return std::nullopt;
}

void JobDisk::giveBack()
{
    claim_.reset();
    if (!unmounted_)
        return;
    log_.step(Operation::Verify, {"Mounting “%1$@” again", log_.diskName(), {}});
    for (const Sentence& failure : unmounted_->mountAgain())
        log_.error(failure);
    unmounted_.reset();
}

}  // namespace pellar
