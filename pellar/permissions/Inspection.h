// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/permissions/Permissions.h"
#include "pellar/permissions/Reference.h"
#include "pellar/permissions/RootDirectory.h"

#include <sys/stat.h>

#include <variant>

namespace pellar {

/// A file as it was found, held fast: whatever takes its name, this stays the object.
struct FoundFile {
    FileDescriptor object;
    Permissions permissions;
    struct stat status = {};
};

/// Why a file could not be looked at.
enum class Unseen {
    Missing,
    ElsewhereMounted,  ///< another file system is mounted there
    BehindLink,        ///< a symbolic link is on the way to it, which is not followed
    Unreadable,        ///< an error, or no permission
};

[[nodiscard]] std::variant<FoundFile, Unseen> inspect(const RootDirectory& root,
                                                      const std::string& path);

/// Whether what was found holds what its package brought. Only asked of files that lend rights.
enum class Contents {
    AsPackaged,
    NotAsPackaged,
    NotKnown,  ///< the package does not say, or they cannot be read
};

/// Reads all of it, a quarter of a gigabyte at most.
[[nodiscard]] Contents contentsOf(const FoundFile& file, const Reference& reference);

/// Reads the permissions of what was found once more; none when that fails.
[[nodiscard]] std::optional<Permissions> permissionsOf(int object, struct stat& status);

}  // namespace pellar
