// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QColor>

namespace orvane::desktop {

/// The smallest ratio at which text of ordinary size is readable (WCAG 2.1, 1.4.3).
inline constexpr double readableContrast = 4.5;

/// From 1 (the same colour) to 21 (black on white), as WCAG 2.1 defines the contrast ratio.
double contrastRatio(const QColor& a, const QColor& b);

/// `wanted`, or the nearest lighter or darker colour of its hue that is readable on `background`.
QColor readableOn(const QColor& background, const QColor& wanted);

}  // namespace orvane::desktop
