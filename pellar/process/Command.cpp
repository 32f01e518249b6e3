// SPDX-License-Identifier: Apache-2.0
#include "pellar/process/Command.h"

#include "contract/foundation/UTF8.h"
#include "pellar/process/TrustedPath.h"

#include <unistd.h>

#include <algorithm>

namespace pellar {

std::string shown(const Command& command)
{
    std::string line = command.executable.string();
    for (const std::string& argument : command.arguments)
        line += ' ' + argument;
    return contract::printable(line);
}

namespace {

// Asked again for each job: what root runs must not be another user's.
bool isRunnable(const std::filesystem::path& program)
{
    std::error_code error;
    return std::filesystem::is_regular_file(program, error) &&
           ::access(program.c_str(), X_OK) == 0 && (::geteuid() != 0 || openTrusted(program));
}

}  // namespace

std::filesystem::path findProgram(std::string_view name, std::string_view searchPath)
{
    while (!searchPath.empty()) {
        const std::size_t length = std::min(searchPath.find(':'), searchPath.size());
        const std::filesystem::path directory = searchPath.substr(0, length);
        searchPath.remove_prefix(std::min(length + 1, searchPath.size()));
        if (!directory.is_absolute())
            continue;
        std::filesystem::path program = directory / name;
        if (isRunnable(program))
            return program;
    }
    return {};
}

}  // namespace pellar
