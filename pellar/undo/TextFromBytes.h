// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/UTF8.h"

#include <string>
#include <string_view>

namespace pellar {

// Paths and names are any bytes, and JSON is UTF-8: each byte becomes the character of its number.

inline std::string charactersFrom(std::string_view bytes)
{
    std::string text;
    for (const char byte : bytes)
        contract::appendUTF8(text, static_cast<unsigned char>(byte));
    return text;
}

inline std::string bytesFrom(std::string_view characters)
{
    std::string bytes;
    contract::forEachCharacter(characters,
                               [&](char32_t character) { bytes += static_cast<char>(character); });
    return bytes;
}

}  // namespace pellar
