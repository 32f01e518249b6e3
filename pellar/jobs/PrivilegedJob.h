// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/pellar/DiskReference.h"
#include "pellar/disks/DiskClaim.h"
#include "pellar/jobs/Script.h"
#include "pellar/outcome/Operation.h"

#include <functional>
#include <memory>

namespace pellar {

/// What of a disk a job is about.
enum class Subject { Filesystem, PartitionMap, Permissions };

/// A job for which this user has no right: on a block device that they may not open, on files that
/// are not theirs, or on a part of an image that the kernel has to make a device of.
struct PrivilegedJob {
    Subject subject = Subject::Filesystem;
    Operation operation = Operation::Verify;
    contract::DiskReference disk;
    /// The image file of which the disk is a part, as this user has opened it: whoever does the
    /// job may do no more with it. None for a block device.
    std::shared_ptr<const DiskClaim> image;
    /// The user agrees that archives of packages are fetched (ManagerOptions::archiveFetching).
    bool fetchesArchives = false;
};

/// Makes the script of such a job; empty where there is no way to get the right. Any thread.
using PrivilegedScripts =
    std::function<std::unique_ptr<Script>(const PrivilegedJob&, StopSwitch&, EventRoad&)>;

}  // namespace pellar
