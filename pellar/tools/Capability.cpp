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

}  // namespace

Capability capabilityFor(std::string_view filesystemType, Operation operation,
                         std::string_view toolPath)
{
    const Tool* const tool = toolFor(filesystemType);
    if (tool == nullptr)
        return {contract::kPLErrorUnsupported,
                {objectionTo(filesystemType), contract::printable(filesystemType), {}},
                {}};
    if (operation == Operation::Repair && !tool->canRepair())
        return {contract::kPLErrorNoRepairHere, tool->reasonAgainstRepair, {}};
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

}  // namespace pellar
