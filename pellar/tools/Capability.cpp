// SPDX-License-Identifier: Apache-2.0
#include "pellar/tools/Capability.h"

#include "fixwell/host/foundation/UTF8.h"
#include "pellar/process/Command.h"
#include "pellar/tools/ToolTable.h"

namespace pellar {

Capability capabilityFor(std::string_view filesystemType, Operation operation,
                         std::string_view toolPath)
{
    const Tool* const tool = toolFor(filesystemType);
    if (tool == nullptr)
        return {
            fixwell::kPLErrorUnsupported,
            {"there is no tool for the file system “%1$@”", fixwell::printable(filesystemType), {}},
            {}};
    if (operation == Operation::Repair && !tool->canRepair())
        return {
            fixwell::kPLErrorUnsupported,
            {"%1$@ can verify this file system, but not repair it", std::string(tool->name()), {}},
            {}};
    std::filesystem::path program = findProgram(tool->name(), toolPath);
    if (program.empty())
        return {fixwell::kPLErrorToolMissing,
                {"%1$@ is not installed (package %2$@)", std::string(tool->name()),
                 std::string(tool->package())},
                {}};
    return {fixwell::kPLNoError, {}, std::move(program)};
}

}  // namespace pellar
