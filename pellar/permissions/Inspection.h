// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/outcome/Result.h"
#include "pellar/packages/Accounts.h"
#include "pellar/packages/Permissions.h"
#include "pellar/packages/Reference.h"
#include "pellar/packages/RootDirectory.h"
#include "pellar/texts/Texts.h"

#include <sys/stat.h>

#include <string>
#include <vector>

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

[[nodiscard]] Result<FoundFile, Unseen> inspect(const RootDirectory& root, const std::string& path);

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

/// In what a file differs from its reference. Where the kind differs nothing else is compared.
struct Difference {
    bool kind = false;
    bool mode = false;
    bool user = false;
    bool group = false;
    bool capabilities = false;

    bool isNone() const { return !kind && !mode && !user && !group && !capabilities; }
    friend bool operator==(const Difference&, const Difference&) = default;
};

/// A symbolic link has no mode of its own (symlink(7)), and only regular files have capabilities.
Difference compare(const Reference& should, const Permissions& is);

/// A line for each difference, in the user's language: “Permissions differ on “usr/bin/x”: they
/// are -rw-rw-r--, should be -rw-r--r--.” Names are made fit to be shown.
std::vector<std::string> linesOf(const Difference& difference, const Reference& should,
                                 const Permissions& is, const Accounts& accounts,
                                 const Texts& texts);

}  // namespace pellar
