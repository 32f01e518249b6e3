// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <sys/types.h>

#include <filesystem>

namespace orvane {

/// Of this user, as the system's list of users tells it (getpwuid(3)); empty when it does not.
[[nodiscard]] std::filesystem::path homeDirectoryOf(uid_t user);

}  // namespace orvane
