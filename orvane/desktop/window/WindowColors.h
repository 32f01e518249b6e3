// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/window/ResultSummary.h"

#include <QPalette>

namespace orvane::desktop {

// The colours of what the window draws itself, from the palette that holds: text is readable on its
// ground, and marks and frames are seen on theirs (WCAG 2.1, 1.4.3 and 1.4.11).

struct BannerColors {
    QColor ground;
    QColor text;
    QColor link;
    QColor stripe;
};
[[nodiscard]] BannerColors bannerColors(Tone tone, const QPalette& palette);

/// Of a row in the list of disks.
struct RowColors {
    QColor ground;
    QColor text;
    QColor faint;  ///< of what matters less
    QColor bar;    ///< of progress
    QColor track;  ///< on which the bar grows
};
[[nodiscard]] RowColors rowColors(const QPalette& palette, QPalette::ColorGroup group,
                                  bool isSelected);
/// Of a section's title in that list.
[[nodiscard]] QColor headingColor(const QPalette& palette);

/// A part of a disk in the header; `isMarked`: the pointer or the focus is there.
struct PartColors {
    QColor ground;
    QColor text;
    QColor frame;
};
[[nodiscard]] PartColors partColors(const QPalette& palette, bool isMarked);

/// How full a volume is.
struct SpaceColors {
    QColor used;
    QColor track;
};
[[nodiscard]] SpaceColors spaceColors(const QPalette& palette);

/// The button that stands out.
struct PrimaryColors {
    QColor ground;
    QColor text;
};
[[nodiscard]] PrimaryColors primaryColors(const QPalette& palette, bool isMarked);

}  // namespace orvane::desktop
