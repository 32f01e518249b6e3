// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/window/DiskHeader.h"

#include "orvane/desktop/toolkit/Text.h"
#include "orvane/desktop/window/WindowColors.h"

#include <QEvent>
#include <QHBoxLayout>
#include <QPainter>
#include <QPainterPath>
#include <QStyle>
#include <QVBoxLayout>

#include <algorithm>
#include <utility>

namespace orvane::desktop {
namespace {

constexpr int spacing = 8;      // pixels; the grid of the window
constexpr int iconSide = 40;    // pixels
constexpr int barHeight = 8;    // pixels
constexpr int leastPart = 28;   // pixels, so that it can be hit
constexpr int partSpacing = 3;  // pixels
constexpr double rounding = 4;  // pixels
constexpr double titleScale = 1.35;

}  // namespace

SpaceBar::SpaceBar(QWidget* parent) : QWidget(parent)
{
    setObjectName(QStringLiteral("spaceBar"));
    setFixedHeight(barHeight);
    setMinimumWidth(iconSide);
    setSizePolicy(QSizePolicy::Expanding, QSizePolicy::Fixed);
}

void SpaceBar::show(const pellar::SpaceUse& use, const QString& text)
{
    share_ = static_cast<double>(use.used) / static_cast<double>(use.total);
    setAccessibleName(text);
    update();
}

void SpaceBar::paintEvent(QPaintEvent* /*event*/)
{
    QPainter painter(this);
    painter.setRenderHint(QPainter::Antialiasing);
    painter.setPen(Qt::NoPen);
    QPainterPath frame;
    frame.addRoundedRect(rect(), rounding, rounding);
    painter.setClipPath(frame);
    const SpaceColors colors = spaceColors(palette());
    painter.fillRect(rect(), colors.track);
    QRect used = rect();
    used.setWidth(std::max(1, static_cast<int>(width() * share_)));
    painter.fillRect(QStyle::visualRect(layoutDirection(), rect(), used), colors.used);
}

/// One volume in the bar.
class PartitionBar::Part final : public QAbstractButton {
public:
    Part(const PartitionShare& share, QWidget* parent) : QAbstractButton(parent), share_(share)
    {
        setText(share.name);
        setAccessibleName(share.name);
        setAccessibleDescription(share.toolTip);
        setToolTip(toQtToolTip(fromQt(share.toolTip)));
        setFocusPolicy(Qt::StrongFocus);
        setCursor(Qt::PointingHandCursor);
    }

    const PartitionShare& share() const { return share_; }

protected:
    void paintEvent(QPaintEvent* /*event*/) override
    {
        QPainter painter(this);
        painter.setRenderHint(QPainter::Antialiasing);
        const PartColors colors = partColors(palette(), hasFocus() || underMouse());
        painter.setPen(QPen(colors.frame, hasFocus() ? 2 : 1));
        painter.setBrush(colors.ground);
        painter.drawRoundedRect(QRectF(rect()).adjusted(1, 1, -1, -1), rounding, rounding);
        QRect room = rect().adjusted(6, 0, -6, 0);
        if (!share_.verdict.empty() && room.width() > room.height() / 2) {
            const int side = fontMetrics().ascent();
            const QRect place(room.right() - side + 1, room.top() + (room.height() - side) / 2,
                              side, side);
            verdictIcon(share_.verdict)
                .paint(&painter, QStyle::visualRect(layoutDirection(), rect(), place));
            room.setRight(place.left() - 4);
        }
        painter.setPen(colors.text);
        painter.drawText(QStyle::visualRect(layoutDirection(), rect(), room),
                         Qt::AlignVCenter | Qt::TextSingleLine |
                             QStyle::visualAlignment(layoutDirection(), Qt::AlignLeft),
                         fontMetrics().elidedText(text(), Qt::ElideMiddle, room.width()));
    }

private:
    const PartitionShare share_;
};

PartitionBar::PartitionBar(QWidget* parent) : QWidget(parent)
{
    setObjectName(QStringLiteral("partitionBar"));
    setSizePolicy(QSizePolicy::Expanding, QSizePolicy::Fixed);
}

void PartitionBar::show(const std::vector<PartitionShare>& partitions)
{
    for (Part* const part : std::exchange(parts_, {})) {
        part->hide();
        part->deleteLater();
    }
    for (const PartitionShare& share : partitions) {
        auto* const part = new Part(share, this);
        connect(part, &QAbstractButton::clicked, this, [this, part] {
            // The press may have the bar show another disk.
            if (const std::string identifier = part->share().identifier; chosen_)
                chosen_(identifier);
        });
        part->QWidget::show();
        parts_.push_back(part);
    }
    setFixedHeight(fontMetrics().height() + 2 * spacing);
    place();
}

void PartitionBar::resizeEvent(QResizeEvent* event)
{
    QWidget::resizeEvent(event);
    place();
}

void PartitionBar::place()
{
    double bytes = 0;
    for (const Part* part : parts_)
        bytes += static_cast<double>(part->share().bytes);
    const int count = static_cast<int>(parts_.size());
    // All get what they need to be hit; the rest is shared by their sizes.
    const double rest = std::max(0, width() - count * leastPart - (count - 1) * partSpacing);
    double left = 0;
    for (Part* const part : parts_) {
        const double share = bytes > 0 ? static_cast<double>(part->share().bytes) / bytes : 0;
        const double wide = leastPart + rest * share;
        const QRect place(static_cast<int>(left), 0, static_cast<int>(wide), height());
        part->setGeometry(QStyle::visualRect(layoutDirection(), rect(), place));
        left += wide + partSpacing;
    }
}

DiskHeader::DiskHeader(QWidget* parent)
    : QWidget(parent),
      icon_(new QLabel(this)),
      title_(new ElidedLabel(this)),
      stateIcon_(new QLabel(this)),
      state_(new ElidedLabel(this)),
      facts_(new ElidedLabel(this)),
      use_(new QWidget(this)),
      space_(new SpaceBar(use_)),
      spaceText_(new QLabel(use_)),
      partitions_(new PartitionBar(this)),
      warning_(new QLabel(this))
{
    setObjectName(QStringLiteral("diskHeader"));
    title_->setObjectName(QStringLiteral("diskTitle"));
    state_->setObjectName(QStringLiteral("diskState"));
    facts_->setObjectName(QStringLiteral("diskFacts"));
    for (QLabel* const label : {spaceText_, warning_})
        label->setTextFormat(Qt::PlainText);
    warning_->setWordWrap(true);

    auto* const useRow = new QHBoxLayout(use_);
    useRow->setContentsMargins(0, 0, 0, 0);
    useRow->setSpacing(spacing);
    useRow->addWidget(space_, 1);
    useRow->addWidget(spaceText_);
    auto* const stateRow = new QHBoxLayout;
    stateRow->setSpacing(spacing / 2);
    stateRow->addWidget(stateIcon_);
    stateRow->addWidget(state_, 1);
    auto* const rows = new QVBoxLayout;
    rows->setSpacing(spacing / 2);
    rows->addWidget(title_);
    rows->addLayout(stateRow);
    rows->addWidget(facts_);
    rows->addWidget(use_);
    rows->addWidget(partitions_);
    rows->addWidget(warning_);
    auto* const layout = new QHBoxLayout(this);
    layout->setContentsMargins(2 * spacing, spacing + spacing / 2, 2 * spacing, spacing);
    layout->setSpacing(spacing + spacing / 2);
    layout->addWidget(icon_, 0, Qt::AlignTop);
    layout->addLayout(rows, 1);
    adoptFont();
}

void DiskHeader::show(const SelectionSummary& summary, const QIcon& icon)
{
    shown_ = summary;
    diskIcon_ = icon;
    title_->setFullText(summary.title);
    state_->setFullText(summary.state);
    facts_->setFullText(summary.facts);
    const int side = fontMetrics().ascent();
    stateIcon_->setPixmap(
        summary.verdict.empty()
            ? QPixmap()
            : verdictIcon(summary.verdict).pixmap(QSize(side, side), devicePixelRatioF()));
    icon_->setPixmap(icon.pixmap(QSize(iconSide, iconSide), devicePixelRatioF()));
    warning_->setText(summary.warning);
    if (summary.space) {
        space_->show(*summary.space, summary.spaceText);
        spaceText_->setText(summary.spaceText);
    }
    partitions_->show(summary.partitions);
    adoptRoom();
}

void DiskHeader::setCompact(bool isCompact)
{
    if (std::exchange(isCompact_, isCompact) != isCompact)
        adoptRoom();
}

void DiskHeader::adoptRoom()
{
    icon_->setVisible(!isCompact_ && !diskIcon_.isNull());
    facts_->setVisible(!isCompact_ && !shown_.facts.isEmpty());
    use_->setVisible(!isCompact_ && shown_.space.has_value());
    partitions_->setVisible(!isCompact_ && !shown_.partitions.empty());
    stateIcon_->setVisible(!shown_.verdict.empty());
    state_->setVisible(!shown_.state.isEmpty());
    warning_->setVisible(!shown_.warning.isEmpty());
}

void DiskHeader::changeEvent(QEvent* event)
{
    QWidget::changeEvent(event);
    if (event->type() == QEvent::FontChange)
        adoptFont();
}

void DiskHeader::adoptFont()
{
    QFont title = font();
    title.setPointSizeF(title.pointSizeF() * titleScale);
    title.setBold(true);
    title_->setFont(title);
    QFont bold = font();
    bold.setBold(true);
    warning_->setFont(bold);
}

}  // namespace orvane::desktop
