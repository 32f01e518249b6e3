// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/permissions/Accounts.h"
#include "pellar/permissions/Permissions.h"

#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace pellar {

/// An owner as an archive has it.
struct PackagedOwner {
    std::string name;  ///< empty where the archive has numbers only
    std::uint32_t number = 0;
};

/// A member of a package, as its archive or its mtree(5) has it.
struct PackagedFile {
    std::string path;  ///< without "./" and "/" before it
    FileKind kind = FileKind::Other;
    mode_t mode = 0;
    PackagedOwner user;
    PackagedOwner group;
};

/// The name's number on this system, and the archive's own for a name that it does not know, as
/// dpkg and tar do it.
std::uint32_t numberFor(const PackagedOwner& owner, const AccountNames& accounts);

/// The files of a .deb archive (deb(5)), open for reading; none when it is no sound archive.
[[nodiscard]] std::optional<std::vector<PackagedFile>> readDebArchive(int file);

/// The files of a mtree(5), packed or not; none when it is none.
[[nodiscard]] std::optional<std::vector<PackagedFile>> readMtree(std::string_view bytes);

/// The same as a mtree(5); none when the library fails.
[[nodiscard]] std::optional<std::string> writeMtree(const std::vector<PackagedFile>& files);

}  // namespace pellar
