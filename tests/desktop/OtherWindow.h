// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string_view>

namespace orvane::desktop::test {

/// The first argument that makes the test program be another user of the same histories.
inline constexpr std::string_view otherWindow = "--other-window";

/// Arguments: `otherWindow`, the directory with the settings and histories, an image file, and how
/// often it is to be verified. Opens a window, does so, and ends with 0 when every job has ended.
int runOtherWindow(int argc, char** argv);

}  // namespace orvane::desktop::test
