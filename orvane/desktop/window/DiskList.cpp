// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/window/DiskList.h"

#include "orvane/desktop/toolkit/StyledLine.h"
#include "orvane/desktop/toolkit/Text.h"
#include "orvane/desktop/window/DiskRow.h"
#include "orvane/desktop/window/WindowColors.h"

#include <QApplication>
#include <QHeaderView>
#include <QKeyEvent>
#include <QPainter>
#include <QStyledItemDelegate>

#include <algorithm>
#include <cmath>

namespace orvane::desktop {
namespace {

constexpr int margin = 5;                      // pixels, around a row and between its parts
constexpr int progressHeight = 3;              // pixels
constexpr double greatestShareOfState = 0.55;  // of the line that the name stands on

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

RowColors colorsOf(const QStyleOptionViewItem& option)
{
    return rowColors(
        option.palette,
        option.state.testFlag(QStyle::State_Active) ? QPalette::Active : QPalette::Inactive,
        option.state.testFlag(QStyle::State_Selected));
}

/// The lines of one row, drawn from the outside in: what stands at the end takes its room first.
class RowPainter {
public:
    RowPainter(QPainter& painter, const QStyleOptionViewItem& option)
        : painter_(painter), option_(option)
    {
        // Names, devices and times are read in their own direction.
        painter.setLayoutDirection(Qt::LayoutDirectionAuto);
    }

    void setLine(const QRect& line, const QFont& font, const QColor& color)
    {
        left_ = line;
        useFont(font, color);
    }

    /// In at most this share of the room that is left.
    void drawAtEnd(const QString& text, double share = 1)
    {
        if (!text.isEmpty())
            draw(takeFromEnd(std::min(widthOf(text), static_cast<int>(left_.width() * share))),
                 text, Qt::ElideRight);
    }

    void drawAtEnd(const QIcon& icon)
    {
        if (icon.isNull())
            return;
        const int side = painter_.fontMetrics().ascent();
        icon.paint(&painter_, visual(takeFromEnd(side)), Qt::AlignCenter);
    }

    void drawAtStart(const QString& text)
    {
        QRect taken = left_;
        taken.setWidth(std::min(widthOf(text), left_.width()));
        left_.setLeft(taken.right() + 1 + margin);
        draw(taken, text);
    }

    bool hasRoomFor(const QString& text) const { return widthOf(text) <= left_.width(); }

    void drawInTheRest(const QString& text, Qt::TextElideMode elision = Qt::ElideMiddle)
    {
        draw(left_, text, elision);
    }

    void useFont(const QFont& font, const QColor& color)
    {
        painter_.setFont(font);
        painter_.setPen(color);
    }

private:
    // Whole pixels hold what was measured in fractions of them.
    int widthOf(const QString& text) const
    {
        return static_cast<int>(std::ceil(QFontMetricsF(painter_.font()).horizontalAdvance(text))) +
               1;
    }

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

    void draw(const QRect& rect, const QString& text, Qt::TextElideMode elision = Qt::ElideMiddle)
    {
        // An ellipsis and a letter say nothing.
        const int least = painter_.fontMetrics().averageCharWidth() * 3;
        if (rect.width() < std::min(least, widthOf(text)))
            return;
        const QString shown = painter_.fontMetrics().elidedText(text, elision, rect.width());
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

/// A thin bar below the lines of the row, on a track that shows how far there is to go.
void drawProgress(QPainter& painter, const QStyleOptionViewItem& option, const QRect& lines,
                  double percent)
{
    if (percent <= 0)
        return;
    const RowColors colors = colorsOf(option);
    QRect track = lines;
    track.setTop(lines.bottom());
    track.setHeight(progressHeight);
    QRect done = track;
    done.setWidth(static_cast<int>(track.width() * percent / 100));
    const auto draw = [&](const QRect& bar, const QColor& color) {
        painter.setBrush(color);
        painter.drawRoundedRect(QStyle::visualRect(option.direction, option.rect, bar),
                                progressHeight / 2.0, progressHeight / 2.0);
    };
    painter.setRenderHint(QPainter::Antialiasing);
    painter.setPen(Qt::NoPen);
    draw(track, colors.track);
    draw(done, colors.bar);
}

/// Around the row that the keys act on.
void drawFocus(QPainter& painter, const QStyleOptionViewItem& option)
{
    if (!option.state.testFlag(QStyle::State_HasFocus))
        return;
    painter.setRenderHint(QPainter::Antialiasing);
    painter.setPen(QPen(colorsOf(option).text, 1.5));
    painter.setBrush(Qt::NoBrush);
    painter.drawRoundedRect(QRectF(option.rect).adjusted(1.5, 1.5, -1.5, -1.5), 3, 3);
}

void drawHeading(QPainter& painter, const QStyleOptionViewItem& option)
{
    painter.setFont(nameFont(detailFont(option.font)));
    painter.setPen(headingColor(option.palette));
    const QRect line = option.rect.adjusted(margin, margin, -margin, 0);
    painter.drawText(line,
                     Qt::AlignVCenter | Qt::TextSingleLine |
                         QStyle::visualAlignment(option.direction, Qt::AlignLeft),
                     painter.fontMetrics().elidedText(option.text, Qt::ElideRight, line.width()));
}

/// Draws a disk in two lines, from the columns of its row: its name and its state, and below what
/// it is and when it was last checked.
class DiskDelegate final : public QStyledItemDelegate {
public:
    using QStyledItemDelegate::QStyledItemDelegate;

    void paint(QPainter* painter, const QStyleOptionViewItem& option,
               const QModelIndex& index) const override;
    QSize sizeHint(const QStyleOptionViewItem& option, const QModelIndex& index) const override;

private:
    static void drawDisk(QPainter& painter, const QStyleOptionViewItem& option,
                         const QModelIndex& index);
};

}  // namespace

void DiskDelegate::paint(QPainter* painter, const QStyleOptionViewItem& option,
                         const QModelIndex& index) const
{
    QStyleOptionViewItem complete = option;
    initStyleOption(&complete, index);
    painter->save();
    if (index.data(DiskTreeModel::HeadingRole).toBool()) {
        drawHeading(*painter, complete);
    } else {
        const bool hasFocus = complete.state.testFlag(QStyle::State_HasFocus);
        complete.state.setFlag(QStyle::State_HasFocus, false);
        drawRowBackground(*painter, complete);
        complete.state.setFlag(QStyle::State_HasFocus, hasFocus);
        drawDisk(*painter, complete, index);
        drawFocus(*painter, complete);
    }
    painter->restore();
}

void DiskDelegate::drawDisk(QPainter& painter, const QStyleOptionViewItem& option,
                            const QModelIndex& index)
{
    const int height = heightOfLines(option.font);
    QRect rest = option.rect.adjusted(margin, 0, -margin, 0);
    rest.setTop(rest.top() + (rest.height() - height) / 2);
    rest.setHeight(height);
    const int side = height * 3 / 4;
    const QRect icon(rest.left(), rest.top() + (height - side) / 2, side, side);
    option.icon.paint(&painter, QStyle::visualRect(option.direction, option.rect, icon));
    rest.setLeft(icon.right() + 2 * margin);

    const RowColors colors = colorsOf(option);
    const QColor& color = colors.text;
    const QColor& faint = colors.faint;
    QRect line = rest;
    line.setHeight(QFontMetrics(nameFont(option.font)).height());
    RowPainter row(painter, option);
    row.setLine(line, option.font, color);
    row.drawAtEnd(cell(index, DiskColumn::Verdict).toString(), greatestShareOfState);
    row.drawAtEnd(cell(index, DiskColumn::Verdict, Qt::DecorationRole).value<QIcon>());
    row.useFont(nameFont(option.font), color);
    row.drawAtStart(index.data(DiskTreeModel::NameRole).toString());
    row.useFont(detailFont(option.font), faint);
    row.drawInTheRest(index.data(DiskTreeModel::BearerRole).toString());
    line.setTop(line.bottom() + 1);
    line.setBottom(rest.bottom());
    row.setLine(line, detailFont(option.font), faint);
    row.drawAtEnd(cell(index, DiskColumn::LastCheck).toString());
    const QString details = index.data(DiskTreeModel::DetailsRole).toString();
    row.drawInTheRest(
        row.hasRoomFor(details) ? details : index.data(DiskTreeModel::ShortDetailsRole).toString(),
        Qt::ElideRight);
    drawProgress(painter, option, rest, index.data(DiskTreeModel::PercentRole).toDouble());
}

QSize DiskDelegate::sizeHint(const QStyleOptionViewItem& option, const QModelIndex& index) const
{
    const int height = index.data(DiskTreeModel::HeadingRole).toBool()
                           ? QFontMetrics(detailFont(option.font)).height()
                           : heightOfLines(option.font);
    return {QFontMetrics(option.font).averageCharWidth() * 30, height + 2 * margin};
}

DiskList::DiskList(const Translator& texts, QWidget* parent)
    : QTreeView(parent), texts_(texts), note_(new ListNote(*this))
{
    setObjectName(QStringLiteral("diskList"));
    setAccessibleName(toQt(texts.text("Disks")));
    setAccessibleDescription(toQt(texts.text("Select the disks to verify or repair.")));
    setSelectionMode(ExtendedSelection);
    setSelectionBehavior(SelectRows);
    setEditTriggers(NoEditTriggers);
    setExpandsOnDoubleClick(false);
    setHeaderHidden(true);
    setHorizontalScrollBarPolicy(Qt::ScrollBarAlwaysOff);
    setFrameShape(NoFrame);
    setItemDelegate(new DiskDelegate(this));
    connect(this, &QAbstractItemView::doubleClicked, this, [this] {
        if (events_.opened)
            events_.opened();
    });
}

void DiskList::show(DiskTreeModel& disks, std::function<void()> selectionChanged)
{
    disks_ = &disks;
    setModel(&disks);
    // The others are drawn in the first one.
    for (int column = 1; column < diskColumnCount; ++column)
        setColumnHidden(column, true);
    header()->setMinimumSectionSize(0);
    header()->setSectionResizeMode(0, QHeaderView::Stretch);
    // Volumes are what the user is here for.
    connect(&disks, &QAbstractItemModel::rowsInserted, this,
            [this](const QModelIndex& parent) { setExpanded(parent, true); });
    selectionChanged_ = std::move(selectionChanged);
    connect(selectionModel(), &QItemSelectionModel::selectionChanged, this, [this] {
        if (!isSynchronizing_)
            selectionChanged_();
    });
    tellWhatIsMissing();
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
    const QModelIndex index =
        disks_ != nullptr ? disks_->indexOf(row.facts.identifier) : QModelIndex();
    return index.isValid() ? disks_->partsOf(*disks_->diskAt(index)) : std::vector<DiskRow>();
}

void DiskList::select(const Disk& disk)
{
    if (disks_ == nullptr)
        return;
    const auto row = [&] {
        return disks_->indexOf(disk.facts().identifier);
    };
    if (!row().isValid() && disks_->isFiltered() && disks_->isKnown(disk) && events_.clearFilter)
        events_.clearFilter();
    if (const QModelIndex found = row(); found.isValid())
        setCurrentIndex(found);
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
    tellWhatIsMissing();
}

// Told once the rows are as they will be: a listener asks for them.
void DiskList::setFilter(const QString& words)
{
    filter_ = words.simplified();
    if (disks_ == nullptr)
        return;
    const auto before = selectedDisks();
    isSynchronizing_ = true;
    disks_->setFilter(filter_);
    isSynchronizing_ = false;
    tellWhatIsMissing();
    if (selectedDisks() != before)
        selectionChanged_();
}

void DiskList::selectFirst()
{
    const QModelIndex first = moveCursor(MoveHome, Qt::NoModifier);
    if (first.isValid())
        setCurrentIndex(first);
}

void DiskList::setLooking(bool isLooking)
{
    isLooking_ = isLooking;
    tellWhatIsMissing();
}

void DiskList::tellWhatIsMissing()
{
    const auto text = [this](std::string_view key) {
        return toQt(texts_.text(key));
    };
    if (disks_ == nullptr || disks_->rowCount() != 0)
        note_->hide();
    else if (disks_->hasDisks())
        note_->tell(toQt(texts_.sentence("No disk matches “%@”.", {fromQt(filter_)})),
                    text("Show All Disks"), events_.clearFilter);
    else if (isLooking_)
        note_->tell(text("Looking for disks…"));
    else
        note_->tell(text("No disks were found. Open an image, or drop one here."),
                    text("Open Image…"), [this] {
                        if (events_.openImage)
                            events_.openImage();
                    });
}

void DiskList::keyPressEvent(QKeyEvent* event)
{
    const bool isReturn = event->key() == Qt::Key_Return || event->key() == Qt::Key_Enter;
    const auto& answer = isReturn ? events_.opened : events_.search;
    if ((isReturn || event->text() == QLatin1String("/")) && answer)
        answer();
    else
        QTreeView::keyPressEvent(event);
}

}  // namespace orvane::desktop
