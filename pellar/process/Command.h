// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <filesystem>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

namespace pellar {

/// What a run of a tool may do to the disk.
enum class Access { ReadOnly, ReadWrite };

struct Exited {
    int status;
    friend bool operator==(const Exited&, const Exited&) = default;
};

struct Killed {
    int signal;
    friend bool operator==(const Killed&, const Killed&) = default;
};

struct NotStarted {
    int error;  ///< errno
    friend bool operator==(const NotStarted&, const NotStarted&) = default;
};

/// How a run of a tool ended. Only `Exited` carries a status, so a tool that crashed or never
/// started cannot be mistaken for one that answered 0.
using Ending = std::variant<Exited, Killed, NotStarted>;

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
/// skipped: the current directory holds no tools. So is, for root, what others could
/// change.
std::filesystem::path findProgram(std::string_view name, std::string_view searchPath);

}  // namespace pellar
