// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "fixwell/host/foundation/UserDefaults.h"
#include "orvane/desktop/window/MainWindow.h"

namespace orvane::desktop {

/// Where the window stood, and how it was divided, is kept in the settings from one start to the
/// next. What cannot be read is left as it is.
void restoreWindow(MainWindow& window, const fixwell::UserDefaults& settings);
void saveWindow(MainWindow& window, fixwell::UserDefaults& settings);

}  // namespace orvane::desktop
