// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/StyledText.h"

#include <QFont>

namespace orvane::desktop {

/// The size, in points, at which modules want their ordinary text: the desktop's own size.
inline constexpr double moduleTextPoints = 11;

/// What a module's points are multiplied by to become the desktop's.
double desktopFontScale();

/// The application's font in the weight that `font` asks for, and in its size times `scale`.
QFont scaledFont(const contract::Font& font, double scale);

}  // namespace orvane::desktop
