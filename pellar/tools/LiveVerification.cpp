// SPDX-License-Identifier: Apache-2.0
#include "pellar/tools/LiveVerification.h"

#include "contract/foundation/UTF8.h"

namespace pellar {
namespace {

// e2scrub(8) checks a snapshot, for which it needs a logical volume and free space beside it.
// xfs_scrub(8) says of itself: "xfs_scrub is an immature utility! Do not run this program unless
// you have backups of your data!"
std::string_view objectionTo(std::string_view filesystemType)
{
    if (filesystemType.starts_with("ext"))
        return "%1$@ can be verified in use only from a snapshot, and none is made here; start a "
               "rescue system to verify it";
    if (filesystemType == "xfs")
        return "the tool that verifies %1$@ in use calls itself experimental, and is not used; "
               "start a rescue system to verify it";
    return "%1$@ cannot be verified while it is in use; start a rescue system to verify it";
}

}  // namespace

Capability liveCapabilityFor(std::string_view filesystemType, std::string_view toolPath)
{
    if (filesystemType == "btrfs")
        return capabilityFor(filesystemType, Operation::Verify, toolPath);
    return {contract::kPLErrorUnsupported,
            {objectionTo(filesystemType), contract::printable(filesystemType), {}},
            {}};
}

}  // namespace pellar
