// SPDX-License-Identifier: Apache-2.0
#include "orvane/privileges/HomeDirectory.h"

#include <pwd.h>

#include <array>

namespace orvane {

std::filesystem::path homeDirectoryOf(uid_t user)
{
    passwd entry = {};
    passwd* found = nullptr;
    std::array<char, 16384> buffer;
    if (::getpwuid_r(user, &entry, buffer.data(), buffer.size(), &found) != 0 || found == nullptr)
        return {};
    return found->pw_dir;
}

}  // namespace orvane
