// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/permissions/RootFiles.h"

#include <filesystem>
#include <optional>
#include <string>
#include <vector>

namespace pellar {

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
