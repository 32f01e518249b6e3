// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/window/ProgressArea.h"

#include "contract/foundation/UTF8.h"
#include "orvane/desktop/toolkit/Text.h"

#include <QHBoxLayout>

#include <algorithm>
#include <cmath>

namespace orvane::desktop {
namespace {

void keepRoomWhenHidden(QWidget& widget)
{
    QSizePolicy policy = widget.sizePolicy();
    policy.setRetainSizeWhenHidden(true);
    widget.setSizePolicy(policy);
    widget.hide();
}

}  // namespace

ProgressArea::ProgressArea(const QString& accessibleName, QWidget* parent)
    : QWidget(parent), bar_(new QProgressBar(this)), label_(new QLabel(this))
{
    bar_->setObjectName(QStringLiteral("progressBar"));
    bar_->setAccessibleName(accessibleName);
    bar_->setTextVisible(false);
    label_->setObjectName(QStringLiteral("statusLine"));
    label_->setTextFormat(Qt::PlainText);
    label_->setTextInteractionFlags(Qt::TextSelectableByMouse);
    label_->setMinimumWidth(1);
    label_->setSizePolicy(QSizePolicy::Ignored, QSizePolicy::Fixed);

    auto* const layout = new QHBoxLayout(this);
    layout->setContentsMargins(12, 6, 12, 6);
    layout->setSpacing(12);
    layout->addWidget(label_, 3);
    layout->addWidget(bar_, 2);
    keepRoomWhenHidden(*bar_);
    keepRoomWhenHidden(*label_);
}

void ProgressArea::setBarActive(bool isActive)
{
    isBarActive_ = isActive;
    bar_->setVisible(isActive);
    showRange();
}

void ProgressArea::setTextActive(bool isActive)
{
    label_->setVisible(isActive);
}

void ProgressArea::setIndeterminate(bool isIndeterminate)
{
    isIndeterminate_ = isIndeterminate;
    showRange();
}

void ProgressArea::setPercent(double percent)
{
    tenths_ = std::isfinite(percent)
                  ? static_cast<int>(std::lround(std::clamp(percent, 0.0, 100.0) * 10))
                  : 0;
    showRange();
}

// A bar without a range is animated for as long as it lives, also while it is hidden.
void ProgressArea::showRange()
{
    const bool isMoving = isIndeterminate_ && isBarActive_;
    bar_->setRange(0, isMoving ? 0 : 1000);
    if (!isMoving)
        bar_->setValue(tenths_);
}

void ProgressArea::setText(std::string_view text)
{
    text_ = toQt(contract::printable(text));
    showText();
}

void ProgressArea::showText()
{
    label_->setText(label_->fontMetrics().elidedText(text_, Qt::ElideMiddle, label_->width()));
    label_->setToolTip(toQtToolTip(fromQt(text_)));
}

void ProgressArea::resizeEvent(QResizeEvent* event)
{
    QWidget::resizeEvent(event);
    showText();
}

}  // namespace orvane::desktop
