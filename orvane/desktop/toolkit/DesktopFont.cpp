// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/DesktopFont.h"

#include <QApplication>
#include <QFontInfo>

namespace orvane::desktop {

double desktopFontScale()
{
    // A font that was set in pixels has no point size of its own; QFontInfo knows one.
    return QFontInfo(QApplication::font()).pointSizeF() / moduleTextPoints;
}

QFont scaledFont(const contract::Font& font, double scale)
{
    QFont result = QApplication::font();
    const double size = font.points > 0 ? font.points : moduleTextPoints;
    result.setPointSizeF(size * scale);
    result.setBold(font.isBold);
    return result;
}

}  // namespace orvane::desktop
