// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace pellar {

/// A package whose files are there, as var/lib/dpkg/status has it (deb822(5), dpkg(1)).
struct DpkgPackage {
    std::string name;
    std::string version;
    std::string architecture;
    /// Its scripts have run: what is between two states says nothing yet.
    bool isConfigured = false;

    /// As apt names its archive, "ntfs-3g_1%3a2022.10.3-1_amd64.deb", without ".deb".
    std::string fileName() const;
    /// Its three words are such as Debian allows.
    bool isAllowed() const;

    friend bool operator==(const DpkgPackage&, const DpkgPackage&) = default;
};

/// Packages with a name, a version or an architecture that Debian does not allow are left out:
/// they become file names here.
std::vector<DpkgPackage> parseDpkgStatus(std::string_view text);

}  // namespace pellar
