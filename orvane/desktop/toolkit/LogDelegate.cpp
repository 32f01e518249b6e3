// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/LogDelegate.h"

#include "contract/pellar/MessageKeys.h"
#include "orvane/desktop/toolkit/ColorScheme.h"
#include "orvane/desktop/toolkit/LogModel.h"
#include "orvane/desktop/toolkit/LogTable.h"
#include "orvane/desktop/toolkit/StyledLine.h"
#include "orvane/desktop/toolkit/Text.h"

#include <QFontMetricsF>
#include <QHelpEvent>
#include <QPainter>
#include <QToolTip>

#include <algorithm>
#include <cmath>
#include <optional>

namespace orvane::desktop {
namespace {

constexpr int mostLines = 12;  // a name may be as long as it likes
constexpr double indent = 14;  // pixels: rows stand below their heading's title
constexpr double padding = 4;  // above and below what a heading says
constexpr double gap = 6;      // above a heading
constexpr int heightOfEnd = 4;
constexpr double spacing = 8;  // between title and verdict
constexpr double bandStrength = 0.07;
constexpr double quietStrength = 0.65;
const QColor markColor(0xff, 0xdd, 0x57);
const QColor problemColor(Qt::red);  // of the dot before a tool's line, as of our own sentences

QColor mixed(const QColor& ground, const QColor& above, double strength)
{
    const auto part = [strength](int under, int over) {
        return static_cast<int>(std::lround(under + (over - under) * strength));
    };
    return {part(ground.red(), above.red()), part(ground.green(), above.green()),
            part(ground.blue(), above.blue())};
}

const LogModel& modelOf(const QModelIndex& index)
{
    return *static_cast<const LogModel*>(index.model());
}

/// What a row says, and where; the frame is what the module's view gives, in the table's viewport.
struct Row {
    const LogModel& model;
    contract::OutlineView& view;
    StyledLine line;
    QRectF frame;
    bool isHeading = false;
    bool isEnd = false;      ///< of a run: an empty line
    bool isProblem = false;  ///< as a tool tells it
};

/// None where there is nothing to show yet, or any more.
std::optional<Row> rowAt(const QModelIndex& index)
{
    if (!index.isValid() || index.model() == nullptr)
        return std::nullopt;
    const LogModel& model = modelOf(index);
    contract::OutlineView* const view = model.view();
    if (view == nullptr || view->dataCell() == nullptr)
        return std::nullopt;
    const auto number = static_cast<std::size_t>(model.viewRow(index.row()));
    const contract::Rect frame = view->frameOfCellAtColumnRow(0, number);
    const contract::OutlineItem item = model.itemAt(index.row());
    return Row{model,
               *view,
               oneLine(textOfRow(*view, number)),
               QRectF(frame.x, frame.y, frame.width, frame.height),
               model.isHeading(index.row()),
               item.integer(contract::kFsckVerbosity) == contract::verbosity::summary,
               item.string(contract::kFsckMessageType) == contract::kFsckProblem.text()};
}

bool isSelected(const QStyleOptionViewItem& option)
{
    return option.state.testFlag(QStyle::State_Selected);
}

QPalette::ColorGroup groupOf(const QStyleOptionViewItem& option)
{
    return !option.state.testFlag(QStyle::State_Enabled) ? QPalette::Disabled
           : option.state.testFlag(QStyle::State_Active) ? QPalette::Active
                                                         : QPalette::Inactive;
}

QColor bandColor(const QStyleOptionViewItem& option)
{
    const auto group = groupOf(option);
    return mixed(option.palette.color(group, QPalette::Base),
                 option.palette.color(group, QPalette::Text), bandStrength);
}

LineLooks looksOf(const QStyleOptionViewItem& option, const Row& row)
{
    const auto group = groupOf(option);
    const bool isChosen = isSelected(option);
    LineLooks looks;
    looks.fontScale = desktopFontScale();
    looks.defaultFont = row.view.dataCell()->font();
    looks.textColor =
        option.palette.color(group, isChosen ? QPalette::HighlightedText : QPalette::Text);
    looks.background = isChosen        ? option.palette.color(group, QPalette::Highlight)
                       : row.isHeading ? bandColor(option)
                                       : option.palette.color(group, QPalette::Base);
    looks.keepsTextColor = isChosen;
    looks.isMirrored = option.direction == Qt::RightToLeft;
    return looks;
}

/// Where the text occurs that is searched.
QList<QTextLayout::FormatRange> marksIn(const QString& line, const QString& searched)
{
    QList<QTextLayout::FormatRange> marks;
    if (searched.isEmpty())
        return marks;
    QTextCharFormat format;
    format.setBackground(markColor);
    format.setForeground(Qt::black);
    for (qsizetype at = line.indexOf(searched, 0, Qt::CaseInsensitive); at >= 0;
         at = line.indexOf(searched, at + searched.size(), Qt::CaseInsensitive))
        marks.append({static_cast<int>(at), static_cast<int>(searched.size()), format});
    return marks;
}

const QString& searchedIn(const QStyleOptionViewItem& option)
{
    static const QString nothing;
    const auto* const table = dynamic_cast<const LogTable*>(option.widget);
    return table != nullptr ? table->searched() : nothing;
}

QRectF bodyRect(const QStyleOptionViewItem& option, const QRectF& frame)
{
    const bool isMirrored = option.direction == Qt::RightToLeft;
    return frame.adjusted(isMirrored ? 0 : indent, 0, isMirrored ? -indent : 0, 0);
}

/// Before the first line of a row that a tool told as a problem: its text is as plain as any other.
void paintDot(QPainter& painter, const QStyleOptionViewItem& option, const Row& row,
              const LineLooks& looks)
{
    constexpr double side = 5;
    const double height = QFontMetricsF(widestFont(row.line, looks)).height();
    const bool isMirrored = option.direction == Qt::RightToLeft;
    const double middle =
        isMirrored ? row.frame.right() - indent / 2 : row.frame.left() + indent / 2;
    const QColor color =
        looks.keepsTextColor ? looks.textColor : readableOn(looks.background, problemColor);
    painter.save();
    painter.setRenderHint(QPainter::Antialiasing);
    painter.setPen(Qt::NoPen);
    painter.setBrush(color);
    painter.drawEllipse(QPointF(middle, row.frame.top() + height / 2 + 1), side / 2, side / 2);
    painter.restore();
}

double heightOf(const StyledLine& line, const LineLooks& looks, double width, double oneLineHeight)
{
    const QFontMetricsF metrics(widestFont(line, looks));
    if (metrics.horizontalAdvance(line.text) <= width)
        return oneLineHeight;
    const double added = std::max(0.0, wrappedHeight(line, looks, width) - metrics.height());
    return std::min(oneLineHeight * mostLines, oneLineHeight + std::ceil(added));
}

/// The parts of a heading.
class Heading {
public:
    Heading(const QStyleOptionViewItem& option, const Row& row, int shown)
        : option_(option),
          row_(row),
          note_(row.model.noteAt(shown)),
          isOpen_(row.model.isOpen(shown)),
          looks_(looksOf(option, row)),
          metrics_(scaledFont(looks_.defaultFont, looks_.fontScale))
    {
        const double mark = std::ceil(metrics_.height() * 0.9);
        const bool hasSign = !note_.sign.isNull() && !note_.verdict.isEmpty();
        signSide_ = hasSign ? mark : 0;
        const double words = metrics_.horizontalAdvance(note_.verdict);
        verdictWidth_ = note_.verdict.isEmpty() ? 0 : std::ceil(words) + signSide_ + spacing;
        titleWidth_ = std::max(metrics_.averageCharWidth(),
                               row.frame.width() - indent - verdictWidth_ - spacing);
    }

    double height(double oneLineHeight) const
    {
        return titleHeight(oneLineHeight) + detailsHeight() + 2 * padding + gap;
    }

    void paint(QPainter& painter) const
    {
        const QRectF band = QRectF(option_.rect).adjusted(0, gap, 0, 0);
        if (!isSelected(option_))
            painter.fillRect(band, looks_.background);
        const double left = row_.frame.left();
        const double top = band.top() + padding;
        const double titleHeight = band.height() - 2 * padding - detailsHeight();
        paintTriangle(painter, placed({left, top, indent, metrics_.height()}));
        LineLooks titleLooks = looks_;
        titleLooks.marks = marksIn(row_.line.text, searchedIn(option_));
        drawWrapped(painter, placed({left + indent, top, titleWidth_, titleHeight}), row_.line,
                    titleLooks);
        paintVerdict(painter,
                     {row_.frame.right() - verdictWidth_, top, verdictWidth_, metrics_.height()});
        if (!note_.details.isEmpty())
            paintDetails(painter, {left + indent, top + titleHeight, row_.frame.width() - indent,
                                   detailsHeight()});
    }

private:
    double titleHeight(double oneLineHeight) const
    {
        return heightOf(row_.line, looks_, titleWidth_, oneLineHeight);
    }
    double detailsHeight() const { return note_.details.isEmpty() ? 0 : metrics_.height(); }

    /// From left to right, in the direction of the window.
    QRectF placed(const QRectF& rect) const
    {
        if (option_.direction != Qt::RightToLeft)
            return rect;
        const QRectF& frame = row_.frame;
        return {frame.left() + frame.right() - rect.right(), rect.top(), rect.width(),
                rect.height()};
    }
    /// On the side where the text of the window starts; a text reads in its own direction.
    void putText(QPainter& painter, const QRectF& rect, const QString& text) const
    {
        const Qt::Alignment side = looks_.isMirrored ? Qt::AlignRight : Qt::AlignLeft;
        painter.setLayoutDirection(text.isRightToLeft() ? Qt::RightToLeft : Qt::LeftToRight);
        painter.drawText(
            rect,
            static_cast<int>(side | Qt::AlignAbsolute | Qt::AlignVCenter) | Qt::TextSingleLine,
            text);
    }

    void paintTriangle(QPainter& painter, const QRectF& rect) const
    {
        const QPointF middle(rect.center().x() - 1, rect.center().y());
        const double half = 3.5;
        const double ahead = option_.direction == Qt::RightToLeft ? -half : half;
        const QPolygonF open({middle + QPointF(-half, -half / 2), middle + QPointF(half, -half / 2),
                              middle + QPointF(0, half)});
        const QPolygonF closed({middle + QPointF(-ahead / 2, -half),
                                middle + QPointF(-ahead / 2, half), middle + QPointF(ahead, 0)});
        painter.save();
        painter.setRenderHint(QPainter::Antialiasing);
        painter.setPen(Qt::NoPen);
        painter.setBrush(looks_.textColor);
        painter.drawPolygon(isOpen_ ? open : closed);
        painter.restore();
    }

    void paintVerdict(QPainter& painter, const QRectF& rect) const
    {
        if (note_.verdict.isEmpty())
            return;
        painter.save();
        painter.setFont(scaledFont(looks_.defaultFont, looks_.fontScale));
        painter.setPen(looks_.textColor);
        if (signSide_ > 0)
            note_.sign.paint(&painter,
                             placed({rect.left(), rect.top(), signSide_, rect.height()}).toRect());
        putText(painter, placed(rect.adjusted(signSide_ + spacing / 2, 0, 0, 0)), note_.verdict);
        painter.restore();
    }

    void paintDetails(QPainter& painter, const QRectF& rect) const
    {
        painter.save();
        painter.setFont(scaledFont(looks_.defaultFont, looks_.fontScale));
        painter.setPen(isSelected(option_)
                           ? looks_.textColor
                           : readableOn(looks_.background,
                                        mixed(looks_.background, looks_.textColor, quietStrength)));
        putText(painter, placed(rect),
                metrics_.elidedText(note_.details, Qt::ElideRight, rect.width()));
        painter.restore();
    }

    const QStyleOptionViewItem& option_;
    const Row& row_;
    const RunNote note_;
    const bool isOpen_;
    const LineLooks looks_;
    const QFontMetricsF metrics_;
    double signSide_ = 0;
    double verdictWidth_ = 0;
    double titleWidth_ = 0;
};

}  // namespace

void LogDelegate::paint(QPainter* painter, const QStyleOptionViewItem& option,
                        const QModelIndex& index) const
{
    const auto row = rowAt(index);
    QStyleOptionViewItem background = option;
    if (row && row->isHeading)
        background.rect.adjust(0, static_cast<int>(gap), 0, 0);
    drawRowBackground(*painter, background);
    if (!row)
        return;
    if (row->isHeading) {
        Heading(option, *row, index.row()).paint(*painter);
        return;
    }
    LineLooks looks = looksOf(option, *row);
    looks.marks = marksIn(row->line.text, searchedIn(option));
    drawWrapped(*painter, bodyRect(option, row->frame), row->line, looks);
    if (row->isProblem)
        paintDot(*painter, option, *row, looks);
}

QSize LogDelegate::sizeHint(const QStyleOptionViewItem& option, const QModelIndex& index) const
{
    const auto row = rowAt(index);
    if (!row)
        return option.rect.size();
    if (row->isEnd)
        return {option.rect.width(), heightOfEnd};
    const double oneLineHeight = option.rect.height();
    const double height = row->isHeading
                              ? Heading(option, *row, index.row()).height(oneLineHeight)
                              : heightOf(row->line, looksOf(option, *row),
                                         bodyRect(option, row->frame).width(), oneLineHeight);
    return {option.rect.width(), static_cast<int>(std::ceil(height))};
}

bool LogDelegate::helpEvent(QHelpEvent* event, QAbstractItemView* table,
                            const QStyleOptionViewItem& option, const QModelIndex& index)
{
    const auto row = rowAt(index);
    if (!row || event->type() != QEvent::ToolTip)
        return QStyledItemDelegate::helpEvent(event, table, option, index);
    const LineLooks looks = looksOf(option, *row);
    const double width = bodyRect(option, row->frame).width();
    const bool isCut = wrappedHeight(row->line, looks, width) > row->frame.height() + 1;
    QToolTip::showText(event->globalPos(), isCut ? toQtToolTip(fromQt(row->line.text)) : QString(),
                       table);
    return true;
}

}  // namespace orvane::desktop
