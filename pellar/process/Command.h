// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <filesystem>
#include <string>
#include <string_view>
#include <vector>

namespace pellar {

/// A program and its arguments. It is never given to a shell.
struct Command {
    std::filesystem::path executable;  ///< absolute
    std::vector<std::string> arguments;
    /// It reads what strangers wrote and needs no rights for it: see reduceRights.
    bool isReduced = false;
    /// Where it may write when its rights are reduced, as far as the kernel can see to that.
    std::filesystem::path writable = {};
};

/// One line for a log: the words, separated by blanks, fit to be shown.
std::string shown(const Command& command);

/// The program `name` in the first directory of `searchPath` ("/usr/sbin:/usr/bin") that has it as
/// an executable regular file; empty when none has. Directories that are not absolute are
/// skipped: what lies in the current directory is nobody's tool. So is, for root, what others could
/// change.
std::filesystem::path findProgram(std::string_view name, std::string_view searchPath);

}  // namespace pellar
