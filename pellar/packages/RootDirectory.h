// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/process/FileDescriptor.h"

#include <cstddef>
#include <filesystem>
#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace pellar {

/// Directories that a system has merged into others, "bin" into "usr/bin": packages name their
/// files by either path.
class PathAliases {
public:
    /// `target` as the link has it, from the directory of the link on or absolute. One that leads
    /// upwards is not taken.
    void add(const std::string& link, std::string target);
    bool isAlias(const std::string& path) const { return aliases_.count(path) > 0; }

    /// The path by which the file is found without following a link. From the root on, without
    /// "/" at its ends, "." or empty parts; a path with ".." stays as it is.
    std::string canonical(std::string_view path) const;

private:
    std::string once(const std::string& path) const;

    std::map<std::string, std::string> aliases_;
};

/// Without "./", "/" at the ends, and doubled "/".
std::string withoutSlashes(std::string_view path);

/// What can be read of an installed system: regular files and the names in directories below its
/// root. A process without rights of its own asks another for them.
class RootFiles {
public:
    virtual ~RootFiles() = default;

    /// A regular file for reading; links stay inside the root.
    [[nodiscard]] virtual FileDescriptor openFile(const std::string& path) const = 0;
    /// What a directory holds, sorted, without "." and ".."; empty when it cannot be read.
    [[nodiscard]] virtual std::vector<std::string> names(const std::string& directory) const = 0;
    virtual const PathAliases& aliases() const = 0;

    /// The contents of a regular file of at most `largest` bytes.
    [[nodiscard]] std::optional<std::string> read(const std::string& path,
                                                  std::size_t largest) const;
};

/// The bytes of an open file from its beginning on; none when there are more than `largest`, or
/// when they cannot be read.
[[nodiscard]] std::optional<std::string> contentsOf(int file, std::size_t largest);

/// The root of an installed system, and the ways into it that do not lead out again: whoever
/// could write to the disk may have left any link on it. Any thread.
class RootDirectory final : public RootFiles {
public:
    /// None when there is no such directory; errno says why.
    [[nodiscard]] static std::optional<RootDirectory> open(const std::filesystem::path& path);

    /// The object itself (O_PATH), on this file system, reached without following any link.
    /// None with errno: ELOOP, a link was on the way; EXDEV, it is on another file system;
    /// ENOENT, ENOTDIR, it is not there.
    [[nodiscard]] FileDescriptor openObject(const std::string& path) const;

    [[nodiscard]] FileDescriptor openFile(const std::string& path) const override;
    [[nodiscard]] std::vector<std::string> names(const std::string& directory) const override;
    [[nodiscard]] bool has(const std::string& path) const;

    const PathAliases& aliases() const override { return aliases_; }

private:
    explicit RootDirectory(FileDescriptor directory) : directory_(std::move(directory)) {}

    void findAliases();

    FileDescriptor directory_;
    PathAliases aliases_;
};

}  // namespace pellar
