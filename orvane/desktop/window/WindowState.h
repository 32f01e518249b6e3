// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/support/OVPreferences.h"
#include "orvane/desktop/window/MainWindow.h"

namespace orvane::desktop {

/// Where the window stood, and how it was divided, is kept in the settings from one start to the
/// next. What cannot be read is left as it is.
void restoreWindow(MainWindow& window, const contract::UserDefaults& settings);
void saveWindow(MainWindow& window, contract::UserDefaults& settings);

}  // namespace orvane::desktop
