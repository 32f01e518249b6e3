// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/QtControls.h"

#include "orvane/desktop/toolkit/StyledLine.h"
#include "orvane/desktop/toolkit/Text.h"

#include <QGuiApplication>
#include <QPushButton>

#include <utility>

namespace orvane::desktop {

std::uint64_t modifierFlags(Qt::KeyboardModifiers modifiers)
{
    std::uint64_t flags = 0;
    if (modifiers.testFlag(Qt::ShiftModifier))
        flags |= contract::modifierShift;
    if (modifiers.testFlag(Qt::ControlModifier))
        flags |= contract::modifierControl;
    if (modifiers.testFlag(Qt::AltModifier))
        flags |= contract::modifierOption;
    return flags;
}

std::uint16_t keyCodeOf(int qtKey)
{
    switch (qtKey) {
        case Qt::Key_Backspace: return contract::keyDelete;
        case Qt::Key_Delete: return contract::keyForwardDelete;
        case Qt::Key_Clear: return contract::keyKeypadClear;
        default: return otherKey;
    }
}

std::uint64_t QtEvents::currentModifierFlags() const
{
    return modifierFlags(QGuiApplication::keyboardModifiers());
}

QtTextField::QtTextField(QLabel& label) : label_(label)
{
    label_.setTextFormat(Qt::RichText);
    label_.setTextInteractionFlags(Qt::TextSelectableByMouse | Qt::TextSelectableByKeyboard);
}

void QtTextField::setToolTip(std::string_view text)
{
    label_.setToolTip(toQtToolTip(text));
}

void QtTextField::setAttributedStringValue(const contract::StyledText& text)
{
    label_.setText(toQt(html(text, desktopFontScale())));
    label_.setAccessibleDescription(toQt(text.characters()));
}

QtTextView::QtTextView(QPlainTextEdit& widget) : widget_(widget)
{
    widget_.setReadOnly(true);
    widget_.setVisible(!widget_.document()->isEmpty());
}

void QtTextView::setString(std::string_view text)
{
    widget_.setPlainText(toQt(text));
    widget_.setVisible(!text.empty());
}

QtButton::QtButton(QAbstractButton& widget, Pressed pressed)
    : widget_(widget),
      clicks_(QObject::connect(&widget, &QAbstractButton::clicked, &widget,
                               [this, pressed = std::move(pressed)] { pressed(*this); })),
      title_(fromQt(widget.text()))
{
}

QtButton::~QtButton()
{
    QObject::disconnect(clicks_);
}

void QtButton::setToolTip(std::string_view text)
{
    setModuleText(toolTip_, text);
}

void QtButton::setReason(std::string_view reason)
{
    setModuleText(reason_, reason);
}

void QtButton::setModuleText(std::string& text, std::string_view value)
{
    if (text == value)
        return;
    text = value;
    hostReason_.clear();
    showToolTip();
}

void QtButton::setHostReason(std::string_view reason)
{
    if (widget_.isEnabled() || hostReason_ == reason)
        return;
    hostReason_ = reason;
    showToolTip();
}

void QtButton::setEnabled(bool isEnabled)
{
    widget_.setEnabled(isEnabled);
    if (isEnabled && !std::exchange(hostReason_, {}).empty())
        showToolTip();
}

void QtButton::showToolTip()
{
    std::string text = toolTip_;
    for (const std::string& reason : {reason_, hostReason_})
        if (!reason.empty())
            text += (text.empty() ? "" : "\n\n") + reason;
    widget_.setToolTip(toQtToolTip(text));
    widget_.setAccessibleDescription(toQt(text));
}

void QtButton::setTitle(std::string_view title)
{
    if (title_ == title)
        return;
    title_ = title;
    // A new text would replace the shortcut by the text's own, which has none.
    const QKeySequence shortcut = widget_.shortcut();
    widget_.setText(toQtTitle(title));
    widget_.setShortcut(shortcut);
    widget_.setAccessibleName(toQt(title));
}

void QtButton::setKeyEquivalent(std::string_view key)
{
    isDefault_ = key == "\r";
    if (auto* const push = qobject_cast<QPushButton*>(&widget_)) {
        push->setAutoDefault(isDefault_);
        push->setDefault(isDefault_);
    }
    if (!isDefault_)
        widget_.setShortcut(QKeySequence(toQt(key)));
}

}  // namespace orvane::desktop
