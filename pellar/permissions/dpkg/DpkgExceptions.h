// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/permissions/Accounts.h"
#include "pellar/permissions/PathAliases.h"
#include "pellar/permissions/Reference.h"

#include <map>
#include <string>
#include <string_view>
#include <vector>

namespace pellar {

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
