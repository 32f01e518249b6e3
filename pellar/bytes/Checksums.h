// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/partitions/Bytes.h"

namespace pellar {

/// CRC-32 as a GPT uses it: the polynomial of ISO 3309, 0x04C11DB7, reflected (UEFI Specification
/// 2.10, 5.3.2).
std::uint32_t crc32(ByteView bytes);

}  // namespace pellar
