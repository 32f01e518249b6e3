// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/packages/Accounts.h"
#include "pellar/packages/Reference.h"
#include "pellar/packages/RootDirectory.h"

#include <map>
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

/// What the administrator has set once and for all, var/lib/dpkg/statoverride
/// (dpkg-statoverride(1)). A line with an account that the system does not know leaves the file
/// in doubt.
std::vector<Reference> parseStatOverrides(std::string_view text, const Accounts& accounts,
                                          const PathAliases& aliases);

/// Files that were put aside for another package's, var/lib/dpkg/diversions (dpkg-divert(1)).
class Diversions {
public:
    Diversions() = default;
    Diversions(std::string_view text, const PathAliases& aliases);

    /// Where the package's file really is.
    std::string placeOf(const std::string& path, const std::string& package) const;

private:
    struct Diversion {
        std::string to;
        std::string package;
    };
    std::map<std::string, Diversion> diversions_;
};

}  // namespace pellar
