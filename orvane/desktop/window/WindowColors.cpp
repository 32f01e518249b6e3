// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/window/WindowColors.h"

#include "orvane/desktop/toolkit/ColorScheme.h"

namespace orvane::desktop {
namespace {

constexpr double bannerTint = 0.12;  ///< of the tone's colour in the ground
constexpr double faintShare = 0.72;  ///< of the text's colour
constexpr double trackShare = 0.18;
constexpr double partTint = 0.14;
constexpr double markedTint = 0.3;

QColor toneColor(Tone tone, const QPalette& palette)
{
    switch (tone) {
        case Tone::Good: return {0x2e, 0x8b, 0x45};
        case Tone::Caution: return {0xb0, 0x74, 0x08};
        case Tone::Bad: return {0xc6, 0x2f, 0x2f};
        case Tone::Neutral: break;
    }
    return palette.color(QPalette::Highlight);
}

}  // namespace

BannerColors bannerColors(Tone tone, const QPalette& palette)
{
    const QColor color = toneColor(tone, palette);
    const QColor ground = mixedColor(palette.color(QPalette::Window), color, bannerTint);
    return {ground, readableOn(ground, palette.color(QPalette::WindowText)),
            readableOn(ground, palette.color(QPalette::Link)),
            readableOn(ground, color, visibleContrast)};
}

RowColors rowColors(const QPalette& palette, QPalette::ColorGroup group, bool isSelected)
{
    RowColors colors;
    colors.ground = palette.color(group, isSelected ? QPalette::Highlight : QPalette::Base);
    colors.text = palette.color(group, isSelected ? QPalette::HighlightedText : QPalette::Text);
    colors.faint = readableOn(colors.ground, mixedColor(colors.ground, colors.text, faintShare));
    colors.track = mixedColor(colors.ground, colors.text, trackShare);
    colors.bar = readableOn(colors.track,
                            isSelected ? colors.text : palette.color(group, QPalette::Highlight),
                            visibleContrast);
    return colors;
}

QColor headingColor(const QPalette& palette)
{
    const QColor ground = palette.color(QPalette::Base);
    const QColor quiet = palette.color(QPalette::PlaceholderText);
    return readableOn(ground, mixedColor(ground, quiet, quiet.alphaF()));
}

PartColors partColors(const QPalette& palette, bool isMarked)
{
    const QColor color = palette.color(QPalette::Highlight);
    const QColor ground =
        mixedColor(palette.color(QPalette::Base), color, isMarked ? markedTint : partTint);
    return {ground, readableOn(ground, palette.color(QPalette::Text)),
            readableOn(palette.color(QPalette::Window), color, visibleContrast)};
}

SpaceColors spaceColors(const QPalette& palette)
{
    const QColor track = mixedColor(palette.color(QPalette::Window),
                                    palette.color(QPalette::WindowText), trackShare);
    return {readableOn(track, palette.color(QPalette::Highlight), visibleContrast), track};
}

PrimaryColors primaryColors(const QPalette& palette, bool isMarked)
{
    const QColor text = palette.color(QPalette::HighlightedText);
    const QColor color = palette.color(QPalette::Highlight);
    return {readableOn(text, isMarked ? mixedColor(color, text, 0.12) : color), text};
}

}  // namespace orvane::desktop
