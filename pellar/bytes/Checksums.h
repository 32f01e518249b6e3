// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/bytes/Bytes.h"

namespace pellar {

/// CRC-32 as a GPT uses it: the polynomial of ISO 3309, 0x04C11DB7, reflected (UEFI Specification
/// 2.10, 5.3.2).
std::uint32_t crc32(ByteView bytes);

/// CRC-32C, the polynomial 0x1EDC6F41, reflected and without the final inversion, as ext4 uses it.
std::uint32_t crc32c(ByteView bytes);

}  // namespace pellar
