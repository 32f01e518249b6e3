// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/texts/Catalogue.h"

#include <chrono>
#include <cstdint>
#include <string>

namespace orvane {

/// "512 B", "1.5 MiB", "40 GiB": at most three digits, in powers of 1024 (IEC 80000-13).
std::string byteCount(std::uint64_t bytes);

/// "2024-05-06 07:08", the local time.
std::string localTime(std::chrono::system_clock::time_point time);

/// "2024-05-06 07:08:09 +0200 (CEST)", the local time.
std::string zonedTime(std::chrono::system_clock::time_point time);

/// "42 s", "1 min 5 s", "2 h 10 min", in the user's language.
std::string durationText(std::chrono::system_clock::duration duration, const Translator& texts);

}  // namespace orvane
