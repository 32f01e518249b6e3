// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/SupportHost.h"

#include <string>
#include <vector>

namespace orvane::desktop {

/// What is opened at the start: what was named and, where the user wants it (`reopensImages`), the
/// images that were open at the last end, as far as they are still there.
[[nodiscard]] std::vector<std::string> disksToOpen(SupportHost& host,
                                                   std::vector<std::string> named);

/// At the end: keeps the open images for the next start, or forgets those of the last time.
void rememberImages(SupportHost& host);

}  // namespace orvane::desktop
