// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <string>

namespace pellar {

/// What libblkid finds in a region of a disk.
struct Signature {
    /// "ext4", "vfat", "crypto_LUKS"; empty when there is none, or more than one that disagree.
    std::string type;
    bool isAmbivalent = false;
};

Signature probeSignature(int descriptor, std::uint64_t offset, std::uint64_t length);

}  // namespace pellar
