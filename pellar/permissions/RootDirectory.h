// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/permissions/PathAliases.h"
#include "pellar/process/FileDescriptor.h"

#include <filesystem>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace pellar {

/// The root of an installed system, and the ways into it that do not lead out again: whoever
/// could write to the disk may have left any link on it. Any thread.
class RootDirectory {
public:
    /// None when there is no such directory; errno says why.
    [[nodiscard]] static std::optional<RootDirectory> open(const std::filesystem::path& path);

    /// The object itself (O_PATH), on this file system, reached without following any link.
    /// None with errno: ELOOP, a link was on the way; EXDEV, it is on another file system;
    /// ENOENT, ENOTDIR, it is not there.
    [[nodiscard]] FileDescriptor openObject(const std::string& path) const;

    /// The contents of a regular file of at most `largest` bytes; links stay inside the root.
    [[nodiscard]] std::optional<std::string> read(const std::string& path,
                                                  std::size_t largest) const;
    /// A regular file for reading; links stay inside the root.
    [[nodiscard]] FileDescriptor openFile(const std::string& path) const;
    /// What a directory holds, sorted, without "." and ".."; empty when it cannot be read.
    [[nodiscard]] std::vector<std::string> names(const std::string& directory) const;
    [[nodiscard]] bool has(const std::string& path) const;

    const PathAliases& aliases() const { return aliases_; }

private:
    explicit RootDirectory(FileDescriptor directory) : directory_(std::move(directory)) {}

    void findAliases();

    FileDescriptor directory_;
    PathAliases aliases_;
};

}  // namespace pellar
