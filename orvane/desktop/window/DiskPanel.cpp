// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/window/DiskPanel.h"

#include "orvane/desktop/toolkit/Text.h"
#include "orvane/desktop/window/Symbols.h"

#include <QAction>
#include <QKeyEvent>
#include <QVBoxLayout>

namespace orvane::desktop {
namespace {

constexpr int margin = 6;  // pixels, as the bar of commands has it

}  // namespace

DiskPanel::DiskPanel(const Translator& texts, QWidget* parent)
    : QWidget(parent), field_(new QLineEdit(this)), list_(new DiskList(texts, this))
{
    const QString name = toQt(texts.text("Filter Disks"));
    field_->setObjectName(QStringLiteral("diskFilter"));
    field_->setPlaceholderText(name);
    field_->setAccessibleName(name);
    field_->setAccessibleDescription(
        toQt(texts.text("Shows the disks that have these words in their name, file, device, format "
                        "or state.")));
    field_->setToolTip(toQtToolTip(fromQt(field_->accessibleDescription())));
    field_->addAction(symbol(Symbol::Search, QPalette::PlaceholderText),
                      QLineEdit::LeadingPosition);
    clear_ = field_->addAction(symbol(Symbol::Close, QPalette::Text), QLineEdit::TrailingPosition);
    clear_->setObjectName(QStringLiteral("clearFilter"));
    clear_->setText(toQt(texts.text("Show All Disks")));
    clear_->setVisible(false);
    // Files that fall on it are meant for the window.
    field_->setAcceptDrops(false);
    field_->installEventFilter(this);
    connect(clear_, &QAction::triggered, field_, &QLineEdit::clear);
    connect(field_, &QLineEdit::textChanged, this, [this](const QString& text) {
        clear_->setVisible(!text.isEmpty());
        list_->setFilter(text);
    });
    list_->events().search = [this] {
        search();
    };
    list_->events().clearFilter = [this] {
        field_->clear();
    };

    auto* const rows = new QVBoxLayout(this);
    rows->setContentsMargins(0, 0, 0, 0);
    rows->setSpacing(0);
    auto* const above = new QVBoxLayout;
    above->setContentsMargins(margin, margin, margin, margin);
    above->addWidget(field_);
    rows->addLayout(above);
    rows->addWidget(list_, 1);
    setFocusProxy(list_);
    adoptFont();
}

void DiskPanel::search()
{
    field_->show();
    field_->setFocus(Qt::ShortcutFocusReason);
    field_->selectAll();
}

void DiskPanel::changeEvent(QEvent* event)
{
    QWidget::changeEvent(event);
    if (event->type() == QEvent::FontChange)
        adoptFont();
}

// What is beside it may not press it to where no name can be read.
void DiskPanel::adoptFont()
{
    constexpr int fewestCharacters = 20;
    setMinimumWidth(fontMetrics().averageCharWidth() * fewestCharacters);
}

void DiskPanel::setCompact(bool isCompact)
{
    isCompact_ = isCompact;
    adoptRoom();
}

void DiskPanel::adoptRoom()
{
    const bool isUsed = field_->hasFocus() || !field_->text().isEmpty();
    field_->setVisible(!isCompact_ || isUsed);
    const int room = field_->isVisibleTo(this) ? margin : 0;
    layout()->itemAt(0)->layout()->setContentsMargins(margin, room, margin, room);
}

bool DiskPanel::eventFilter(QObject* watched, QEvent* event)
{
    if (event->type() == QEvent::FocusIn || event->type() == QEvent::FocusOut)
        QMetaObject::invokeMethod(
            this, [this] { adoptRoom(); }, Qt::QueuedConnection);
    if (event->type() != QEvent::KeyPress)
        return QWidget::eventFilter(watched, event);
    switch (static_cast<QKeyEvent*>(event)->key()) {
        case Qt::Key_Escape:
            if (field_->text().isEmpty())
                leave();
            field_->clear();
            return true;
        case Qt::Key_Down:
        case Qt::Key_Return:
        case Qt::Key_Enter: leave(); return true;
        default: return QWidget::eventFilter(watched, event);
    }
}

// On to what was found.
void DiskPanel::leave()
{
    list_->setFocus(Qt::OtherFocusReason);
    if (!list_->selectionModel()->hasSelection())
        list_->selectFirst();
}

}  // namespace orvane::desktop
