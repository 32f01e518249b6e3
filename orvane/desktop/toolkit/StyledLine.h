// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/StyledText.h"

#include <QFont>
#include <QFontMetricsF>
#include <QPainter>
#include <QPalette>
#include <QString>
#include <QStyleOptionViewItem>
#include <QTextLayout>

#include <vector>

namespace orvane::desktop {

/// The size, in points, at which modules want their ordinary text: the desktop's own size.
inline constexpr double moduleTextPoints = 11;

/// What a module's points are multiplied by to become the desktop's.
double desktopFontScale();

/// The application's font in the weight that `font` asks for, and in its size times `scale`.
QFont scaledFont(const contract::Font& font, double scale);

/// A styled text as one line: what a row of the log shows.
struct StyledLine {
    struct Run {
        qsizetype length;
        const contract::TextStyle* style;
    };

    QString text;
    std::vector<Run> runs;
    contract::LineBreak lineBreak = contract::LineBreak::Clip;
};

/// Line ends at the end are dropped, others become spaces; control characters become U+FFFD.
/// Of a text too long for any screen the middle is left out.
StyledLine oneLine(const contract::StyledText& text);

/// The line with an ellipsis where its paragraph style wants it, when it is wider than `width`.
/// The measure is `metrics`; take those of the widest font in the line.
StyledLine fitted(const StyledLine& line, const QFontMetricsF& metrics, double width);

/// How a line is put on a screen or on paper.
struct LineLooks {
    double fontScale = 1;        ///< of the points of the text
    contract::Font defaultFont;  ///< for runs that name none
    QColor textColor;            ///< for runs that name none
    QColor background;           ///< colours are made readable on it
    bool joinsLetters = true;  ///< NO where the text is searched later: “fi” stays two letters
    bool keepsTextColor = false;  ///< as for selected rows: `textColor` for everything
    bool isMirrored = false;      ///< the text stands at the right
    QList<QTextLayout::FormatRange> marks = {};  ///< drawn over the line's own formats
};

/// The font that the line's widest run has.
QFont widestFont(const StyledLine& line, const LineLooks& looks);
/// The styles of the line's runs, for laying it out.
QList<QTextLayout::FormatRange> formatsOf(const StyledLine& line, const LineLooks& looks);
/// Fits the line into the rectangle and draws it, centred vertically.
void draw(QPainter& painter, const QRectF& rect, const StyledLine& line, const LineLooks& looks);
/// Draws the line on as many lines as it takes at the rectangle's width.
void drawWrapped(QPainter& painter, const QRectF& rect, const StyledLine& line,
                 const LineLooks& looks);
/// How high that is.
double wrappedHeight(const StyledLine& line, const LineLooks& looks, double width);

/// A row of a view without its text and its icon: selected or not, as the style has it.
void drawRowBackground(QPainter& painter, const QStyleOptionViewItem& option);

}  // namespace orvane::desktop
