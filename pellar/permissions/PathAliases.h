// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <map>
#include <string>
#include <string_view>

namespace pellar {

/// Directories that a system has merged into others, "bin" into "usr/bin": packages name their
/// files by either path.
class PathAliases {
public:
    /// `target` as the link has it, from the directory of the link on or absolute. One that leads
    /// upwards is not taken.
    void add(const std::string& link, std::string target);
    bool isAlias(const std::string& path) const { return aliases_.count(path) > 0; }

    /// The path by which the file is found without following a link. From the root on, without
    /// "/" at its ends, "." or empty parts; a path with ".." stays as it is.
    std::string canonical(std::string_view path) const;

private:
    std::string once(const std::string& path) const;

    std::map<std::string, std::string> aliases_;
};

/// Without "./", "/" at the ends, and doubled "/".
std::string withoutSlashes(std::string_view path);

}  // namespace pellar
