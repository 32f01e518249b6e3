// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/Contrast.h"

#include <algorithm>
#include <cmath>

namespace orvane::desktop {
namespace {

// Relative luminance as in WCAG 2.1, for sRGB.
double luminance(const QColor& color)
{
    const auto linear = [](double part) {
        return part <= 0.03928 ? part / 12.92 : std::pow((part + 0.055) / 1.055, 2.4);
    };
    return 0.2126 * linear(color.redF()) + 0.7152 * linear(color.greenF()) +
           0.0722 * linear(color.blueF());
}

constexpr int lightnessSteps = 50;

}  // namespace

double contrastRatio(const QColor& a, const QColor& b)
{
    const auto [darker, lighter] = std::minmax({luminance(a), luminance(b)});
    return (lighter + 0.05) / (darker + 0.05);
}

QColor readableOn(const QColor& background, const QColor& wanted)
{
    if (contrastRatio(background, wanted) >= readableContrast)
        return wanted;
    const bool darkens =
        contrastRatio(background, Qt::black) >= contrastRatio(background, Qt::white);
    float hue = 0;
    float saturation = 0;
    float lightness = 0;
    wanted.toHsl().getHslF(&hue, &saturation, &lightness);
    const float end = darkens ? 0.0F : 1.0F;
    for (int step = 1; step < lightnessSteps; ++step) {
        const float part = static_cast<float>(step) / lightnessSteps;
        const QColor candidate =
            QColor::fromHslF(std::max(hue, 0.0F), saturation, lightness + (end - lightness) * part)
                .toRgb();
        if (contrastRatio(background, candidate) >= readableContrast)
            return candidate;
    }
    return darkens ? Qt::black : Qt::white;
}

}  // namespace orvane::desktop
