// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/StyledLine.h"

#include "contract/foundation/UTF8.h"
#include "orvane/desktop/toolkit/ColorScheme.h"
#include "orvane/desktop/toolkit/Text.h"

#include <QApplication>
#include <QFontInfo>

#include <algorithm>

namespace orvane::desktop {
namespace {

// No screen shows more; laying out a line of a megabyte would take seconds.
constexpr std::size_t keptBytesAtEachEnd = 4096;

void append(StyledLine& line, std::string_view bytes, const contract::TextStyle* style)
{
    std::string spaced(bytes);
    std::replace(spaced.begin(), spaced.end(), '\n', ' ');
    const QString part = toQt(contract::printable(spaced));
    if (part.isEmpty())
        return;
    line.text += part;
    line.runs.push_back({part.size(), style});
}

/// The runs of the stretch of `line` that starts at `start` and is `length` long.
void appendRuns(std::vector<StyledLine::Run>& runs, const StyledLine& line, qsizetype start,
                qsizetype length)
{
    const qsizetype end = start + length;
    qsizetype at = 0;
    for (const StyledLine::Run& run : line.runs) {
        const qsizetype first = std::max(at, start);
        const qsizetype last = std::min(at + run.length, end);
        if (first < last)
            runs.push_back({last - first, run.style});
        at += run.length;
    }
}

Qt::TextElideMode elideMode(contract::LineBreak lineBreak)
{
    switch (lineBreak) {
        case contract::LineBreak::TruncateHead: return Qt::ElideLeft;
        case contract::LineBreak::TruncateTail: return Qt::ElideRight;
        case contract::LineBreak::TruncateMiddle: return Qt::ElideMiddle;
        default: return Qt::ElideNone;
    }
}

contract::Font fontOf(const contract::TextStyle& style, const LineLooks& looks)
{
    return style.font.value_or(looks.defaultFont);
}

QFont qtFont(const contract::Font& font, const LineLooks& looks)
{
    QFont result = scaledFont(font, looks.fontScale);
    // Spaced letters are never joined.
    if (!looks.joinsLetters)
        result.setLetterSpacing(QFont::AbsoluteSpacing, 1.0 / 16);
    return result;
}

QColor colorOf(const contract::TextStyle& style, const LineLooks& looks)
{
    if (!style.color || looks.keepsTextColor)
        return looks.textColor;
    const contract::Color& color = *style.color;
    const auto part = [](double value) {
        return static_cast<float>(std::clamp(value, 0.0, 1.0));
    };
    return readableOn(looks.background,
                      QColor::fromRgbF(part(color.red), part(color.green), part(color.blue)));
}

}  // namespace

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

StyledLine oneLine(const contract::StyledText& text)
{
    const std::string_view all = text.characters();
    const std::size_t end = all.find_last_not_of('\n') + 1;
    const bool isCut = end > 2 * keptBytesAtEachEnd;
    const std::size_t headEnd = isCut ? keptBytesAtEachEnd : end;
    const std::size_t tailStart = isCut ? end - keptBytesAtEachEnd : end;

    StyledLine line;
    std::size_t at = 0;
    for (const contract::StyledText::Run& run : text.runs()) {
        const std::size_t runEnd = at + run.length;
        if (at < headEnd)
            append(line, all.substr(at, std::min(runEnd, headEnd) - at), run.style);
        if (isCut && at <= headEnd && headEnd < runEnd)
            append(line, "…", run.style);
        const std::size_t from = std::max(at, tailStart);
        if (from < std::min(runEnd, end))
            append(line, all.substr(from, std::min(runEnd, end) - from), run.style);
        at = runEnd;
    }
    if (text.style().paragraph)
        line.lineBreak = text.style().paragraph->lineBreak;
    return line;
}

StyledLine fitted(const StyledLine& line, const QFontMetricsF& metrics, double width)
{
    StyledLine result;
    result.lineBreak = line.lineBreak;
    result.text = metrics.elidedText(line.text, elideMode(line.lineBreak), width);
    if (result.text == line.text || line.runs.empty())
        return line;
    const auto mismatch =
        std::mismatch(result.text.begin(), result.text.end(), line.text.begin(), line.text.end());
    const qsizetype head = mismatch.first - result.text.begin();
    qsizetype tail = 0;
    while (head + tail < std::min(result.text.size(), line.text.size()) &&
           result.text[result.text.size() - 1 - tail] == line.text[line.text.size() - 1 - tail])
        ++tail;
    appendRuns(result.runs, line, 0, head);
    const qsizetype ellipsis = result.text.size() - head - tail;
    if (ellipsis > 0)
        result.runs.push_back(
            {ellipsis, result.runs.empty() ? line.runs.front().style : result.runs.back().style});
    appendRuns(result.runs, line, line.text.size() - tail, tail);
    return result;
}

QFont widestFont(const StyledLine& line, const LineLooks& looks)
{
    contract::Font widest = line.runs.empty() ? looks.defaultFont : contract::Font();
    for (const StyledLine::Run& run : line.runs) {
        const contract::Font font = fontOf(*run.style, looks);
        widest.isBold = widest.isBold || font.isBold;
        widest.points = std::max(widest.points, font.points);
    }
    return qtFont(widest, looks);
}

QList<QTextLayout::FormatRange> formatsOf(const StyledLine& line, const LineLooks& looks)
{
    QList<QTextLayout::FormatRange> formats;
    int start = 0;
    for (const StyledLine::Run& run : line.runs) {
        QTextCharFormat format;
        format.setFont(qtFont(fontOf(*run.style, looks), looks));
        format.setForeground(colorOf(*run.style, looks));
        formats.append({start, static_cast<int>(run.length), format});
        start += static_cast<int>(run.length);
    }
    return formats;
}

namespace {

void layOut(QTextLayout& layout, const StyledLine& line, const LineLooks& looks,
            QTextOption::WrapMode wrapMode, double width)
{
    QTextOption option;
    option.setWrapMode(wrapMode);
    if (looks.isMirrored)
        option.setAlignment(Qt::AlignRight | Qt::AlignAbsolute);
    layout.setTextOption(option);
    layout.setFormats(formatsOf(line, looks));
    double height = 0;
    layout.beginLayout();
    for (QTextLine part = layout.createLine(); part.isValid(); part = layout.createLine()) {
        part.setLineWidth(width);
        part.setPosition({0, height});
        height += part.height();
        if (wrapMode == QTextOption::NoWrap)
            break;
    }
    layout.endLayout();
}

void drawCentred(QPainter& painter, const QRectF& rect, const QTextLayout& layout,
                 const LineLooks& looks)
{
    const double top = rect.top() + (rect.height() - layout.boundingRect().height()) / 2;
    painter.save();
    painter.setClipRect(rect, Qt::IntersectClip);
    layout.draw(&painter, QPointF(rect.left(), top), looks.marks);
    painter.restore();
}

}  // namespace

void draw(QPainter& painter, const QRectF& rect, const StyledLine& line, const LineLooks& looks)
{
    const QFont font = widestFont(line, looks);
    const StyledLine shown = fitted(line, QFontMetricsF(font, painter.device()), rect.width());
    QTextLayout layout(shown.text, font, painter.device());
    layOut(layout, shown, looks, QTextOption::NoWrap, rect.width());
    drawCentred(painter, rect, layout, looks);
}

void drawWrapped(QPainter& painter, const QRectF& rect, const StyledLine& line,
                 const LineLooks& looks)
{
    QTextLayout layout(line.text, widestFont(line, looks), painter.device());
    layOut(layout, line, looks, QTextOption::WrapAtWordBoundaryOrAnywhere, rect.width());
    drawCentred(painter, rect, layout, looks);
}

double wrappedHeight(const StyledLine& line, const LineLooks& looks, double width)
{
    QTextLayout layout(line.text, widestFont(line, looks));
    layOut(layout, line, looks, QTextOption::WrapAtWordBoundaryOrAnywhere, width);
    return layout.boundingRect().height();
}

void drawRowBackground(QPainter& painter, const QStyleOptionViewItem& option)
{
    QStyleOptionViewItem background = option;
    background.text.clear();
    background.icon = {};
    background.features &= ~QStyleOptionViewItem::HasDecoration;
    const QStyle* const style =
        option.widget != nullptr ? option.widget->style() : QApplication::style();
    style->drawControl(QStyle::CE_ItemViewItem, &background, &painter, option.widget);
}

}  // namespace orvane::desktop
