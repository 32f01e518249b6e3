// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/window/DiskList.h"

#include "orvane/desktop/toolkit/StyledLine.h"
#include "orvane/desktop/toolkit/Text.h"
#include "orvane/desktop/window/DiskRow.h"

#include <QApplication>
#include <QHeaderView>
#include <QPainter>
#include <QStyledItemDelegate>

#include <algorithm>
#include <cmath>

namespace orvane::desktop {
namespace {

constexpr int margin = 5;  // pixels, around a row and between its parts
constexpr int progressHeight = 3;  // pixels

QFont nameFont(const QFont& font)
{
    QFont bold = font;
    bold.setBold(true);
    return bold;
}

QFont detailFont(const QFont& font)
{
    QFont small = font;
    small.setPointSizeF(font.pointSizeF() * 0.9);
    return small;
}

int heightOfLines(const QFont& font)
{
    return QFontMetrics(nameFont(font)).height() + QFontMetrics(detailFont(font)).height();
}

QColor textColor(const QStyleOptionViewItem& option)
{
    const auto group =
        option.state.testFlag(QStyle::State_Active) ? QPalette::Active : QPalette::Inactive;
    return option.palette.color(group, option.state.testFlag(QStyle::State_Selected)
                                           ? QPalette::HighlightedText
                                           : QPalette::Text);
}

/// The lines of one row, drawn from the outside in: what stands at the end takes its room first.
class RowPainter {
public:
    RowPainter(QPainter& painter, const QStyleOptionViewItem& option)
        : painter_(painter), option_(option)
    {
    }

    void setLine(const QRect& line, const QFont& font, const QColor& color)
    {
        left_ = line;
        painter_.setFont(font);
        painter_.setPen(color);
    }

    void drawAtEnd(const QString& text)
    {
        // Whole pixels hold what was measured in fractions of them.
        const double width = std::ceil(QFontMetricsF(painter_.font()).horizontalAdvance(text)) + 1;
        draw(takeFromEnd(std::min(static_cast<int>(width), left_.width())), text);
    }

    void drawAtEnd(const QIcon& icon)
    {
        if (icon.isNull())
            return;
        const int side = painter_.fontMetrics().ascent();
        icon.paint(&painter_, visual(takeFromEnd(side)), Qt::AlignCenter);
    }

    void drawInTheRest(const QString& text) { draw(left_, text); }

private:
    QRect takeFromEnd(int width)
    {
        const QRect taken(left_.right() - width + 1, left_.top(), width, left_.height());
        left_.setRight(taken.left() - margin);
        return taken;
    }

    QRect visual(const QRect& rect) const
    {
        return QStyle::visualRect(option_.direction, option_.rect, rect);
    }

    void draw(const QRect& rect, const QString& text)
    {
        const QString shown =
            painter_.fontMetrics().elidedText(text, Qt::ElideMiddle, rect.width());
        painter_.drawText(visual(rect),
                          Qt::AlignVCenter | Qt::TextSingleLine |
                              QStyle::visualAlignment(option_.direction, Qt::AlignLeft),
                          shown);
    }

    QPainter& painter_;
    const QStyleOptionViewItem& option_;
    QRect left_;
};

QVariant cell(const QModelIndex& index, DiskColumn column, int role = Qt::DisplayRole)
{
    return index.siblingAtColumn(static_cast<int>(column)).data(role);
}

/// A thin line along the lower edge of the row.
void drawProgress(QPainter& painter, const QStyleOptionViewItem& option, double percent)
{
    if (percent <= 0)
        return;
    QRect line = option.rect;
    line.setTop(line.bottom() - progressHeight + 1);
    line.setWidth(static_cast<int>(line.width() * percent / 100));
    const bool isSelected = option.state.testFlag(QStyle::State_Selected);
    painter.fillRect(QStyle::visualRect(option.direction, option.rect, line),
                     option.palette.color(isSelected ? QPalette::HighlightedText
                                                     : QPalette::Highlight));
}

/// Draws a disk in two lines, from the columns of its row: its name and its state, and below what
/// it is and when it was last checked.
class DiskDelegate final : public QStyledItemDelegate {
public:
    using QStyledItemDelegate::QStyledItemDelegate;

    void paint(QPainter* painter, const QStyleOptionViewItem& option,
               const QModelIndex& index) const override;
    QSize sizeHint(const QStyleOptionViewItem& option, const QModelIndex& index) const override;
};

}  // namespace

void DiskDelegate::paint(QPainter* painter, const QStyleOptionViewItem& option,
                         const QModelIndex& index) const
{
    QStyleOptionViewItem complete = option;
    initStyleOption(&complete, index);
    drawRowBackground(*painter, complete);

    painter->save();
    const int height = heightOfLines(complete.font);
    QRect rest = complete.rect.adjusted(margin, 0, -margin, 0);
    rest.setTop(rest.top() + (rest.height() - height) / 2);
    rest.setHeight(height);
    const int side = height * 3 / 4;
    const QRect icon(rest.left(), rest.top() + (height - side) / 2, side, side);
    complete.icon.paint(painter, QStyle::visualRect(complete.direction, complete.rect, icon));
    rest.setLeft(icon.right() + 2 * margin);

    const QColor color = textColor(complete);
    QColor faint = color;
    faint.setAlphaF(0.72F);
    QRect line = rest;
    line.setHeight(QFontMetrics(nameFont(complete.font)).height());
    RowPainter row(*painter, complete);
    row.setLine(line, complete.font, color);
    row.drawAtEnd(cell(index, DiskColumn::Verdict).toString());
    row.drawAtEnd(cell(index, DiskColumn::Verdict, Qt::DecorationRole).value<QIcon>());
    painter->setFont(nameFont(complete.font));
    row.drawInTheRest(index.data().toString());
    line.setTop(line.bottom() + 1);
    line.setBottom(rest.bottom());
    row.setLine(line, detailFont(complete.font), faint);
    row.drawAtEnd(cell(index, DiskColumn::LastCheck).toString());
    row.drawInTheRest(index.data(DiskTreeModel::DetailsRole).toString());
    drawProgress(*painter, complete, index.data(DiskTreeModel::PercentRole).toDouble());
    painter->restore();
}

QSize DiskDelegate::sizeHint(const QStyleOptionViewItem& option, const QModelIndex& /*index*/) const
{
    return {QFontMetrics(option.font).averageCharWidth() * 30,
            heightOfLines(option.font) + 2 * margin};
}

DiskList::DiskList(const Translator& texts, QWidget* parent) : QTreeView(parent)
{
    setObjectName(QStringLiteral("diskList"));
    setAccessibleName(toQt(texts.text("Disks")));
    setAccessibleDescription(toQt(texts.text("Select the disks to verify or repair.")));
    setSelectionMode(ExtendedSelection);
    setSelectionBehavior(SelectRows);
    setUniformRowHeights(true);
    setEditTriggers(NoEditTriggers);
    setHeaderHidden(true);
    setItemDelegate(new DiskDelegate(this));
}

void DiskList::show(DiskTreeModel& disks, std::function<void()> selectionChanged)
{
    disks_ = &disks;
    setModel(&disks);
    // The others are drawn in the first one.
    for (int column = 1; column < diskColumnCount; ++column)
        setColumnHidden(column, true);
    // Volumes are what the user is here for.
    connect(&disks, &QAbstractItemModel::rowsInserted, this,
            [this](const QModelIndex& parent) { setExpanded(parent, true); });
    connect(selectionModel(), &QItemSelectionModel::selectionChanged, this,
            [this, changed = std::move(selectionChanged)] {
                if (!isSynchronizing_)
                    changed();
            });
}

QModelIndexList DiskList::selectionInOrder() const
{
    if (selectionModel() == nullptr)
        return {};
    QModelIndexList rows = selectionModel()->selectedRows();
    // Which stands first: by the path of row numbers from the top.
    const auto path = [](QModelIndex index) {
        std::vector<int> numbers;
        for (; index.isValid(); index = index.parent())
            numbers.insert(numbers.begin(), index.row());
        return numbers;
    };
    std::sort(rows.begin(), rows.end(),
              [&](const QModelIndex& a, const QModelIndex& b) { return path(a) < path(b); });
    return rows;
}

std::vector<DiskList::DiskPointer> DiskList::selectedDisks() const
{
    std::vector<DiskPointer> disks;
    for (const QModelIndex& row : selectionInOrder())
        disks.push_back(disks_->diskAt(row));
    return disks;
}

std::vector<DiskRow> DiskList::selectedRows() const
{
    std::vector<DiskRow> rows;
    for (const QModelIndex& row : selectionInOrder())
        rows.push_back(disks_->rowAt(row));
    return rows;
}

std::vector<DiskRow> DiskList::rowsBelow(const DiskRow& row) const
{
    std::vector<DiskRow> rows;
    const QModelIndex top = disks_ != nullptr ? disks_->indexOf(row.facts.identifier) : QModelIndex();
    for (int i = 0; top.isValid() && i < disks_->rowCount(top); ++i)
        rows.push_back(disks_->rowAt(disks_->index(i, 0, top)));
    return rows;
}

void DiskList::select(const Disk& disk)
{
    const QModelIndex row = disks_ != nullptr ? disks_->indexOf(disk.facts().identifier) : QModelIndex();
    if (row.isValid())
        setCurrentIndex(row);
}

void DiskList::showProgress()
{
    if (disks_ != nullptr)
        disks_->showProgress();
}

void DiskList::synchronize()
{
    if (disks_ == nullptr)
        return;
    isSynchronizing_ = true;
    disks_->synchronize();
    isSynchronizing_ = false;
}

}  // namespace orvane::desktop
