// SPDX-License-Identifier: Apache-2.0
#include "pellar/mounts/Holders.h"

#include "contract/foundation/UTF8.h"

#include <algorithm>
#include <fstream>
#include <system_error>

namespace pellar {
namespace {

namespace fs = std::filesystem;

bool isIn(std::string_view path, std::string_view directory)
{
    return path.starts_with(directory) &&
           (path.size() == directory.size() || path[directory.size()] == '/');
}

bool leadsInto(const fs::path& link, std::string_view directory)
{
    std::error_code error;
    return isIn(fs::read_symlink(link, error).native(), directory);
}

std::vector<fs::path> entriesOf(const fs::path& directory)
{
    std::vector<fs::path> entries;
    std::error_code error;
    fs::directory_iterator end;
    for (fs::directory_iterator entry(directory, error); !error && entry != end;
         entry.increment(error))
        entries.push_back(entry->path());
    return entries;
}

std::string firstLineOf(const fs::path& file)
{
    std::ifstream stream(file);
    std::string line;
    std::getline(stream, line);
    return line;
}

// "7f3a-7f3b r--p 00000000 08:01 131 /mnt/lib.so": the path begins where the first slash is.
bool hasMapped(const fs::path& maps, std::string_view directory)
{
    std::ifstream stream(maps);
    for (std::string line; std::getline(stream, line);)
        if (const std::size_t path = line.find('/');
            path != std::string::npos && isIn(std::string_view(line).substr(path), directory))
            return true;
    return false;
}

bool holds(const fs::path& process, std::string_view directory)
{
    for (const char* const link : {"cwd", "root", "exe"})
        if (leadsInto(process / link, directory))
            return true;
    const auto files = entriesOf(process / "fd");
    return std::any_of(files.begin(), files.end(),
                       [&](const fs::path& file) { return leadsInto(file, directory); }) ||
           hasMapped(process / "maps", directory);
}

bool isNumber(const std::string& text)
{
    return !text.empty() && text.find_first_not_of("0123456789") == std::string::npos;
}

}  // namespace

std::vector<std::string> holdersOf(std::string_view mountPoint, const fs::path& processes,
                                   const fs::path& blockDevices)
{
    std::vector<std::string> holders;
    for (const fs::path& process : entriesOf(processes)) {
        const std::string number = process.filename();
        if (isNumber(number) && holds(process, mountPoint))
            holders.push_back(firstLineOf(process / "comm") + " (" + number + ")");
    }
    for (const fs::path& device : entriesOf(blockDevices))
        if (isIn(firstLineOf(device / "loop/backing_file"), mountPoint))
            holders.push_back(device.filename().native());
    return holders;
}

std::string shownNames(const std::vector<std::string>& names)
{
    constexpr std::size_t most = 4;
    std::string text;
    for (std::size_t i = 0; i < names.size() && i < most; ++i)
        text += (text.empty() ? "" : ", ") + contract::printable(names[i]);
    return names.size() > most ? text + ", …" : text;
}

}  // namespace pellar
