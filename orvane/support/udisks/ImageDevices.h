// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/udisks/Refusal.h"
#include "pellar/process/Command.h"

#include <filesystem>
#include <stop_token>
#include <string>

namespace orvane {

/// Makes an image file a device of the system that stays until it is detached: through UDisks2, or
/// itself where there is none and this is root. Answers the device's node. IsReadOnly where the
/// file is to be written and this user may not; BeingUsed while a job of ours works on it, and
/// none can begin on it meanwhile; Attached where it is. Not on the main thread: may take minutes.
[[nodiscard]] Answer<std::string> attachImage(const std::filesystem::path& image,
                                              pellar::Access access,
                                              const std::stop_token& stop = {});

/// How this user may open the file.
[[nodiscard]] pellar::Access accessTo(const std::filesystem::path& image);

}  // namespace orvane
