// SPDX-License-Identifier: Apache-2.0
#include "pellar/process/KernelFiles.h"

#include "pellar/process/FileDescriptor.h"

#include <fcntl.h>
#include <unistd.h>

#include <array>
#include <cerrno>

namespace pellar {

// No file stream: it throws where a read fails.
std::optional<std::string> readKernelFile(const std::filesystem::path& path)
{
    const FileDescriptor file(::open(path.c_str(), O_RDONLY | O_CLOEXEC));
    std::string contents;
    std::array<char, 4096> piece;
    for (;;) {
        const ssize_t count = file ? ::read(file.get(), piece.data(), piece.size()) : -1;
        if (count < 0 && file && errno == EINTR)
            continue;
        if (count < 0)
            return std::nullopt;
        if (count == 0)
            return contents;
        contents.append(piece.data(), static_cast<std::size_t>(count));
    }
}

}  // namespace pellar
