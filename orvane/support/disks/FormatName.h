// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <string_view>

namespace orvane {

// What people call things that libblkid has shorter names for; another name is answered as it is.

/// A file system: "FAT32" for "vfat" of version "FAT32", "FAT" where the version is not known.
[[nodiscard]] std::string formatName(std::string_view type, std::string_view version);
/// A partition map: "GPT" for "gpt", "MBR" for "dos".
[[nodiscard]] std::string partitionMapName(std::string_view type);

}  // namespace orvane
