// SPDX-License-Identifier: Apache-2.0
#include "pellar/permissions/RootFiles.h"

#include <unistd.h>

#include <array>
#include <cerrno>

namespace pellar {

std::optional<std::string> RootFiles::read(const std::string& path, std::size_t largest) const
{
    const FileDescriptor file = openFile(path);
    return file ? contentsOf(file.get(), largest) : std::nullopt;
}

std::optional<std::string> contentsOf(int file, std::size_t largest)
{
    std::string contents;
    std::array<char, 65536> buffer{};
    while (contents.size() <= largest) {
        const ssize_t count =
            ::pread(file, buffer.data(), buffer.size(), static_cast<off_t>(contents.size()));
        if (count < 0 && errno == EINTR)
            continue;
        if (count < 0)
            return std::nullopt;
        if (count == 0)
            return contents;
        contents.append(buffer.data(), static_cast<std::size_t>(count));
    }
    return std::nullopt;
}

}  // namespace pellar
