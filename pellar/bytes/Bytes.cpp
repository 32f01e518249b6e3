// SPDX-License-Identifier: Apache-2.0
#include "pellar/bytes/Bytes.h"

#include <unistd.h>

#include <algorithm>
#include <limits>

namespace pellar {

std::optional<std::vector<std::uint8_t>> readDisk(int descriptor, std::uint64_t place,
                                                  std::size_t count)
{
    if (place > static_cast<std::uint64_t>(std::numeric_limits<off_t>::max()))
        return std::nullopt;
    std::vector<std::uint8_t> bytes(count);
    const ssize_t read = ::pread(descriptor, bytes.data(), bytes.size(), static_cast<off_t>(place));
    if (read != static_cast<ssize_t>(count))
        return std::nullopt;
    return bytes;
}

std::uint64_t littleEndian(Bytes bytes, std::size_t offset, std::size_t length)
{
    std::uint64_t value = 0;
    for (std::size_t i = length; i-- > 0;)
        value = value << 8U | bytes[offset + i];
    return value;
}

std::uint64_t bigEndian(Bytes bytes, std::size_t offset, std::size_t length)
{
    std::uint64_t value = 0;
    for (std::size_t i = 0; i < length; ++i)
        value = value << 8U | bytes[offset + i];
    return value;
}

bool holdsText(Bytes bytes, std::size_t offset, std::string_view text)
{
    const Bytes part = bytes.subspan(offset, text.size());
    return std::equal(
        part.begin(), part.end(), text.begin(), text.end(),
        [](std::uint8_t byte, char c) { return byte == static_cast<unsigned char>(c); });
}

}  // namespace pellar
