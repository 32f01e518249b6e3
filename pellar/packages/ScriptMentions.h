// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/packages/Permissions.h"
#include "pellar/packages/RootDirectory.h"

#include <set>
#include <string>
#include <string_view>
#include <unordered_set>

namespace pellar {

/// What the scripts that run when a package is installed may have done to files. They are
/// programs, and nobody runs them here: a file of which a script that sets any permissions so
/// much as speaks is in doubt. Pure; asks more often than need be, never too seldom for a path
/// or a name that stands in the script.
class ScriptMentions {
public:
    /// Takes a script's text. A script without a command that sets permissions says nothing.
    void add(std::string_view script, const PathAliases& aliases);

    /// Whether the scripts of the file's own package may have set its permissions.
    bool mayConcernOwn(const std::string& path, FileKind kind) const;
    /// The same for another package's file: by its whole path only.
    bool mayConcernForeign(const std::string& path) const;
    /// Takes what these scripts say of whole paths.
    void addForeign(const ScriptMentions& other);

private:
    void addPath(std::string_view token, bool isWhole, bool isOnPermissionLine,
                 const PathAliases& aliases);

    void addTree(const std::string& path);

    std::set<std::string> paths_;              ///< "/usr/bin/x", without the first "/"
    std::set<std::string> commandPaths_;       ///< those in a line that sets permissions
    std::set<std::string> words_;              ///< names, for loops over them
    std::unordered_set<std::string> endings_;  ///< "x/y" of "$directory/x/y"
    std::unordered_set<std::string> trees_;    ///< with all that they hold
};

}  // namespace pellar
