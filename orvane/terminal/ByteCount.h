// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <string>

namespace orvane {

/// "512 B", "1.5 MiB", "40 GiB": at most three digits, in powers of 1024 (IEC 80000-13).
std::string byteCount(std::uint64_t bytes);

}  // namespace orvane
