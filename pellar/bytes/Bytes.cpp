// SPDX-License-Identifier: Apache-2.0
#include "pellar/bytes/Bytes.h"

#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <limits>

namespace pellar {
namespace {

/// `transfer` is given how much is done, and answers how much more it did.
template <class Transfer>
int transferAll(std::uint64_t place, std::size_t size, Transfer&& transfer)
{
    constexpr auto greatest = static_cast<std::uint64_t>(std::numeric_limits<off_t>::max());
    if (place > greatest || size > greatest - place)
        return EFBIG;
    for (std::size_t done = 0; done < size;) {
        const ssize_t count = transfer(done);
        if (count < 0 && errno == EINTR)
            continue;
        if (count <= 0)
            return count == 0 ? EIO : errno;
        done += static_cast<std::size_t>(count);
    }
    return 0;
}

}  // namespace

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

int readAll(int descriptor, std::uint64_t place, std::span<std::uint8_t> bytes)
{
    return transferAll(place, bytes.size(), [&](std::size_t done) {
        return ::pread(descriptor, bytes.data() + done, bytes.size() - done,
                       static_cast<off_t>(place + done));
    });
}

int writeAll(int descriptor, std::uint64_t place, ByteView bytes)
{
    return transferAll(place, bytes.size(), [&](std::size_t done) {
        return ::pwrite(descriptor, bytes.data() + done, bytes.size() - done,
                        static_cast<off_t>(place + done));
    });
}

bool holdsText(ByteView bytes, std::size_t offset, std::string_view text)
{
    const ByteView part = bytes.subspan(offset, text.size());
    return std::equal(
        part.begin(), part.end(), text.begin(), text.end(),
        [](std::uint8_t byte, char c) { return byte == static_cast<unsigned char>(c); });
}

}  // namespace pellar
