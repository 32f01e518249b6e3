// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/partitions/GPTHeader.h"

#include <string>
#include <vector>

namespace pellar {

/// One partition of a GUID partition table (UEFI Specification 2.10, 5.3.3).
struct GPTEntry {
    std::uint32_t number = 0;  ///< from 1
    GUID unique{};
    std::uint64_t first = 0;
    std::uint64_t last = 0;
    std::string name;  ///< UTF-8 of what stands there; any characters
};

/// The entries that are in use. `bytes` are all of the list that the header describes.
[[nodiscard]] std::vector<GPTEntry> usedEntries(const Bytes& bytes, const GPTHeader& header);

}  // namespace pellar
