// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/window/ListNote.h"

#include "orvane/desktop/toolkit/Text.h"

#include <QVBoxLayout>

#include <utility>

namespace orvane::desktop {

ListNote::ListNote(QAbstractItemView& view)
    : QWidget(view.viewport()), label_(new QLabel(this)), button_(new QPushButton(this))
{
    label_->setObjectName(QStringLiteral("listNote"));
    label_->setTextFormat(Qt::PlainText);
    label_->setWordWrap(true);
    label_->setAlignment(Qt::AlignCenter);
    label_->setForegroundRole(QPalette::PlaceholderText);
    button_->setObjectName(QStringLiteral("listNoteButton"));
    connect(button_, &QPushButton::clicked, this, [this] {
        if (const auto pressed = pressed_)
            pressed();
    });

    auto* const rows = new QVBoxLayout(this);
    rows->addStretch(1);
    rows->addWidget(label_);
    rows->addWidget(button_, 0, Qt::AlignHCenter);
    rows->addStretch(2);
    auto* const whole = new QVBoxLayout(view.viewport());
    whole->setContentsMargins(0, 0, 0, 0);
    whole->addWidget(this);
    hide();
}

void ListNote::tell(const QString& text, const QString& buttonTitle, std::function<void()> pressed)
{
    label_->setText(text);
    label_->setAccessibleName(text);
    button_->setText(toQtTitle(fromQt(buttonTitle)));
    button_->setAccessibleName(buttonTitle);
    button_->setAccessibleDescription(text);
    button_->setVisible(!buttonTitle.isEmpty());
    pressed_ = std::move(pressed);
    show();
}

}  // namespace orvane::desktop
