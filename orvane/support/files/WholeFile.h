// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/files/Failure.h"

#include <cstddef>
#include <filesystem>
#include <string>
#include <string_view>

namespace orvane {

/// The file of this name in the directory; empty where there is no directory.
[[nodiscard]] inline std::filesystem::path fileIn(const std::filesystem::path& directory,
                                                  std::string_view name)
{
    return directory.empty() ? directory : directory / name;
}

/// Writes all of `bytes`; the error number, or 0. Interrupted and partial writes are continued.
[[nodiscard]] int writeAll(int descriptor, std::string_view bytes);

/// The contents of a regular file, or the error number: EFBIG beyond `limit` bytes, EINVAL for
/// anything that is no regular file. Never blocks on a FIFO.
[[nodiscard]] Result<std::string, int> readWholeFile(const std::filesystem::path& file,
                                                     std::size_t limit);

/// Replaces the contents of `file`, so that at every moment, and after a crash, there is either
/// the old or the new file: written beside it, brought to the disk, and renamed over it. A new
/// file is readable and writable by its owner only. A symbolic link keeps pointing at its target.
[[nodiscard]] Result<void, Failure> replaceFile(const std::filesystem::path& file,
                                                std::string_view contents);

/// The same for a file that everybody may read, in a directory that may be another user's: a
/// symbolic link of this name is replaced, and leads nowhere.
[[nodiscard]] Result<void, Failure> replacePublicFile(const std::filesystem::path& file,
                                                      std::string_view contents);

/// Makes the directory and its missing parents, each for the owner alone (mode 0700, as the XDG
/// Base Directory Specification asks).
[[nodiscard]] Result<void, Failure> createPrivateDirectory(const std::filesystem::path& directory);

}  // namespace orvane
