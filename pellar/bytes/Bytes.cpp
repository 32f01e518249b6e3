// SPDX-License-Identifier: Apache-2.0
#include "pellar/bytes/Bytes.h"

#include <unistd.h>

#include <algorithm>
#include <limits>

namespace pellar {

std::optional<Bytes> readDisk(int descriptor, std::uint64_t place, std::size_t count)
{
    if (place > static_cast<std::uint64_t>(std::numeric_limits<off_t>::max()))
        return std::nullopt;
    Bytes bytes(count);
    const ssize_t read = ::pread(descriptor, bytes.data(), bytes.size(), static_cast<off_t>(place));
    if (read != static_cast<ssize_t>(count))
        return std::nullopt;
    return bytes;
}

bool holdsText(ByteView bytes, std::size_t offset, std::string_view text)
{
    const ByteView part = bytes.subspan(offset, text.size());
    return std::equal(
        part.begin(), part.end(), text.begin(), text.end(),
        [](std::uint8_t byte, char c) { return byte == static_cast<unsigned char>(c); });
}

}  // namespace pellar
