// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/outcome/Result.h"
#include "pellar/packages/Accounts.h"
#include "pellar/packages/Permissions.h"

#include <cstddef>
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

    friend bool operator==(const PackagedOwner&, const PackagedOwner&) = default;
};

/// A member of a package, as its archive or its mtree(5) has it.
struct PackagedFile {
    std::string path;  ///< without "./" and "/" before it
    FileKind kind = FileKind::Other;
    mode_t mode = 0;
    PackagedOwner user;
    PackagedOwner group;
    /// Of its contents, see kindOfDigest; empty where it is not known. Of an archive only those
    /// of the files are taken that are setuid or setgid.
    std::string digest;

    friend bool operator==(const PackagedFile&, const PackagedFile&) = default;
};

/// The name's number on this system, and the archive's own for a name that it does not know, as
/// dpkg and tar do it.
std::uint32_t numberFor(const PackagedOwner& owner, const AccountNames& accounts);

/// Why a package says nothing.
enum class PackageFault {
    Malformed,
    BeyondBounds,  ///< it is larger than a package may be, see the constants below
};
using PackagedFiles = Result<std::vector<PackagedFile>, PackageFault>;

/// The largest packages of the distributions have a fifth of these.
inline constexpr std::size_t mostFilesOfPackage = 500'000;
inline constexpr std::uint64_t mostBytesOfPackage = 16ULL << 30U;  ///< unpacked
inline constexpr std::size_t mostBytesOfMtree = 128U << 20U;       ///< unpacked

/// The files of a .deb archive (deb(5)), open for reading and at its beginning. Packed in a way
/// that dpkg does not know, it is malformed; no program is run to unpack it.
[[nodiscard]] PackagedFiles readDebArchive(int file);

/// The files of a mtree(5) as pacman and writeMtree have it: each line has a whole path.
[[nodiscard]] PackagedFiles parseMtree(std::string_view text);

/// The same for a file that may be packed with gzip.
[[nodiscard]] PackagedFiles readMtree(int file);

[[nodiscard]] std::string writeMtree(const std::vector<PackagedFile>& files);

/// Hands the unpacked bytes of a file to `take`, piece by piece, for as long as that answers YES.
/// NO when the file is not sound, or `take` answered NO.
[[nodiscard]] bool unpack(int file, const std::function<bool(std::string_view)>& take);

}  // namespace pellar
