// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <filesystem>
#include <fstream>
#include <string>
#include <system_error>

namespace orvane::test {

/// btrfs-scrub(8) keeps what it has found in a volume, by the UUID in its superblock; takes that
/// away again for a volume in an image.
inline void forgetScrubsOf(const std::filesystem::path& image)
{
    constexpr std::streamoff place = (64 << 10) + 32;
    std::ifstream file(image, std::ios::binary);
    file.seekg(place);
    std::string uuid;
    for (int i = 0; i < 16; ++i) {
        const auto byte = static_cast<unsigned>(file.get());
        const char* const digits = "0123456789abcdef";
        uuid += {digits[byte / 16 % 16], digits[byte % 16]};
        if (i == 3 || i == 5 || i == 7 || i == 9)
            uuid += '-';
    }
    std::error_code ignored;
    std::filesystem::remove("/var/lib/btrfs/scrub.status." + uuid, ignored);
    std::filesystem::remove("/var/lib/btrfs", ignored);  // unless somebody else's are there
}

}  // namespace orvane::test
