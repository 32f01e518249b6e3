// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/packages/RootDirectory.h"

#include <set>
#include <string>
#include <string_view>
#include <vector>

namespace pellar {

class RootFiles;

/// Files whose permissions are set at each start of the system (tmpfiles.d(5)): what a package
/// says of them is not the last word. sysusers.d(5) makes accounts and sets no permissions.
class TemporaryFileRules {
public:
    /// Takes a file of rules.
    void add(std::string_view text, const PathAliases& aliases);
    /// YES for every file where there are more patterns than a system may have.
    bool concern(const std::string& path) const;

private:
    std::set<std::string> paths_;
    std::vector<std::string> patterns_;  ///< as fnmatch(3) has them
    std::vector<std::string> trees_;     ///< patterns of directories, with all that they hold
};

TemporaryFileRules temporaryFileRulesOf(const RootFiles& root);

}  // namespace pellar
