// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/outcome/Result.h"
#include "pellar/process/FileDescriptor.h"

#include <sys/stat.h>

#include <filesystem>
#include <string>

namespace pellar {

// Code and data of other users must not be run or believed with this user's rights, often root's.
// Trusted are root, this process's user, and the owner of the running program, who could change
// that just as well: what lies beside a program that a user built is trusted when root runs it.

/// Why others could change a file or directory with this status, in English ("it belongs to another
/// user (number 1000)"); empty when they could not.
[[nodiscard]] std::string whyOthersCanChange(const struct stat& status);

/// Opens (O_PATH) what the path leads to. For root all directories on the way there are looked at,
/// each as it is opened; others cannot lead it elsewhere on the way. Why it is refused, in English,
/// is answered instead.
[[nodiscard]] Result<FileDescriptor, std::string> openTrusted(const std::filesystem::path& path);

}  // namespace pellar
