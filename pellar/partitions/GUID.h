// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <cstdint>

namespace pellar {

/// As it stands on the disk; never taken apart here, only compared.
using GUID = std::array<std::uint8_t, 16>;

constexpr bool isZero(const GUID& guid)
{
    return guid == GUID{};
}

}  // namespace pellar
