// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/outcome/Result.h"
#include "pellar/texts/Sentence.h"

#include <filesystem>
#include <string>

namespace orvane {

/// Where the file system of this device is mounted as a whole, as the root of an installed system;
/// "/" goes first. Found in the mount table, and never told by whoever asks. Otherwise why there is
/// no such place, or none to which somebody other than root could not put another directory.
[[nodiscard]] pellar::Result<std::string, pellar::Sentence> mountedSystemOn(
    const std::filesystem::path& device);

/// All directories on the way to this one, which is absolute, are root's alone to change.
[[nodiscard]] bool isWayOfRootsAlone(const std::filesystem::path& directory);

}  // namespace orvane
