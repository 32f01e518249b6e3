// SPDX-License-Identifier: Apache-2.0
#include "pellar/partitions/GPTEntries.h"

#include "contract/foundation/UTF8.h"

#include <algorithm>

namespace pellar {
namespace {

constexpr std::size_t nameOffset = 56;
constexpr std::size_t nameUnits = 36;

constexpr bool isHighSurrogate(std::uint64_t unit)
{
    return unit >= 0xD800 && unit < 0xDC00;
}

constexpr bool isLowSurrogate(std::uint64_t unit)
{
    return unit >= 0xDC00 && unit < 0xE000;
}

/// UTF-16LE up to the first zero; half a surrogate pair is U+FFFD.
std::string nameIn(ByteView entry)
{
    std::string name;
    for (std::size_t i = 0; i < nameUnits; ++i) {
        const std::uint64_t unit = littleEndian(entry, nameOffset + 2 * i, 2);
        if (unit == 0)
            break;
        const std::uint64_t next =
            i + 1 < nameUnits ? littleEndian(entry, nameOffset + 2 * (i + 1), 2) : 0;
        if (isHighSurrogate(unit) && isLowSurrogate(next)) {
            contract::appendUTF8(
                name, static_cast<char32_t>(0x10000 + ((unit - 0xD800) << 10U) + (next - 0xDC00)));
            ++i;
        } else {
            const bool isHalf = isHighSurrogate(unit) || isLowSurrogate(unit);
            contract::appendUTF8(name, isHalf ? U'\uFFFD' : static_cast<char32_t>(unit));
        }
    }
    return name;
}

GUID guidAt(ByteView entry, std::size_t offset)
{
    GUID guid;
    std::copy_n(entry.begin() + static_cast<std::ptrdiff_t>(offset), guid.size(), guid.begin());
    return guid;
}

}  // namespace

std::vector<GPTEntry> usedEntries(const Bytes& bytes, const GPTHeader& header)
{
    std::vector<GPTEntry> entries;
    for (std::uint32_t i = 0; i < header.entryCount; ++i) {
        const ByteView entry =
            ByteView(bytes).subspan(std::size_t{i} * header.entryBytes, header.entryBytes);
        if (isZero(guidAt(entry, 0)))  // the type of an entry that is not in use
            continue;
        entries.push_back({i + 1, guidAt(entry, 16), littleEndian(entry, 32, 8),
                           littleEndian(entry, 40, 8), nameIn(entry)});
    }
    return entries;
}

}  // namespace pellar
