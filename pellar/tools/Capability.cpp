// SPDX-License-Identifier: Apache-2.0
#include "pellar/tools/Capability.h"

#include "contract/foundation/UTF8.h"
#include "contract/pellar/ErrorCodes.h"
#include "pellar/process/Command.h"
#include "pellar/tools/ToolTable.h"

namespace pellar {
namespace {

Capability missing(const Tool& tool, std::string_view name)
{
    return {contract::kPLErrorToolMissing,
            {"%1$@ is not installed (package %2$@)", std::string(name), std::string(tool.package)},
            {}};
}

/// Some things on a disk are no file system and need no check.
std::string_view objectionTo(std::string_view filesystemType)
{
    if (filesystemType == "swap")
        return "it is swap space, which holds no files and is never checked";
    if (filesystemType == "crypto_LUKS" || filesystemType == "BitLocker")
        return "it is encrypted; unlock it and check what is in it";
    if (filesystemType == "LVM2_member" || filesystemType == "linux_raid_member")
        return "it is a part of a volume that is put together from several disks";
    return "there is no tool for the file system “%1$@”";
}

// e2scrub(8) checks a snapshot, for which it needs a logical volume and free space beside it.
// xfs_scrub(8) says of itself: "xfs_scrub is an immature utility! Do not run this program unless
// you have backups of your data!"
std::string_view objectionInUse(std::string_view filesystemType)
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

Capability capabilityFor(std::string_view filesystemType, Operation operation,
                         std::string_view toolPath, RepairWay way)
{
    const Tool* const tool = toolFor(filesystemType);
    if (tool == nullptr)
        return {contract::kPLErrorUnsupported,
                {objectionTo(filesystemType), contract::printable(filesystemType), {}},
                {}};
    if (operation == Operation::Repair && !tool->repairs(way))
        return {contract::kPLErrorNoRepairHere, tool->reasonAgainstDirectRepair, {}};
    // A repair is confirmed by verifying, so it needs both.
    std::filesystem::path program = findProgram(tool->name, toolPath);
    if (program.empty())
        return missing(*tool, tool->name);
    if (operation == Operation::Repair)
        program = findProgram(tool->repairName, toolPath);
    if (program.empty())
        return missing(*tool, tool->repairName);
    return {contract::kPLNoError, {}, std::move(program)};
}

Capability liveCapabilityFor(std::string_view filesystemType, std::string_view toolPath)
{
    if (filesystemType == "btrfs")
        return capabilityFor(filesystemType, Operation::Verify, toolPath);
    return {contract::kPLErrorUnsupported,
            {objectionInUse(filesystemType), contract::printable(filesystemType), {}},
            {}};
}

}  // namespace pellar
