// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/window/CommandBar.h"

#include "orvane/desktop/toolkit/Text.h"

#include <QEvent>
#include <QHBoxLayout>

#include <utility>

namespace orvane::desktop {
namespace {

constexpr int margin = 6;  // pixels

}  // namespace

CommandBar::CommandBar(const Translator& texts, QWidget* parent) : QToolBar(parent), texts_(texts)
{
    setObjectName(QStringLiteral("commandBar"));
    setWindowTitle(toQt(texts.text("Commands")));
    setMovable(false);
    setFloatable(false);
    setToolButtonStyle(Qt::ToolButtonTextBesideIcon);
    layout()->setContentsMargins(margin, margin, margin, margin);
    layout()->setSpacing(margin);
}

void CommandBar::add(std::vector<BarCommand> commands)
{
    bool isAtEnd = false;
    for (BarCommand& command : commands) {
        if (command.isAtEnd && !std::exchange(isAtEnd, true)) {
            auto* const space = new QWidget(this);
            space->setSizePolicy(QSizePolicy::Expanding, QSizePolicy::Preferred);
            addWidget(space);
        }
        addButton(std::move(command));
    }
    adoptColors();
    setCompact(isCompact_);
}

void CommandBar::addButton(BarCommand command)
{
    auto* const button = new QToolButton(this);
    button->setObjectName(QLatin1String(command.command.objectName));
    const QString title = toQt(texts_.text(command.command.title));
    button->setText(toQtTitle(fromQt(title)));
    button->setAccessibleName(title);
    button->setAutoRaise(!command.isPrimary);
    button->setFocusPolicy(Qt::TabFocus);
    button->setIcon(symbol(command.symbol, command.isPrimary ? QPalette::HighlightedText
                                                             : QPalette::ButtonText));
    connect(button, &QToolButton::clicked, this, [this, perform = command.command.perform] {
        perform();
        refresh();
    });
    addWidget(button);
    buttons_.push_back({std::move(command), button});
}

void CommandBar::refresh()
{
    for (const Button& button : buttons_) {
        const MenuCommand& command = button.command.command;
        const std::string reason = command.reasonAgainst ? command.reasonAgainst() : std::string();
        const bool isAvailable =
            reason.empty() && (!command.isAvailable || command.isAvailable());
        button.widget->setEnabled(isAvailable);
        QString toolTip = toQt(texts_.text(command.title));
        if (!command.shortcut.isEmpty())
            toolTip += QStringLiteral(" (") +
                       command.shortcut.toString(QKeySequence::NativeText) + QLatin1Char(')');
        if (!reason.empty())
            toolTip += QStringLiteral("\n\n") + toQt(reason);
        button.widget->setToolTip(toQtToolTip(fromQt(toolTip)));
        button.widget->setAccessibleDescription(toQt(reason));
    }
}

void CommandBar::setCompact(bool isCompact)
{
    isCompact_ = isCompact;
    for (const Button& button : buttons_)
        button.widget->setToolButtonStyle(isCompact && !button.command.isPrimary
                                              ? Qt::ToolButtonIconOnly
                                              : Qt::ToolButtonTextBesideIcon);
}

void CommandBar::adoptColors()
{
    for (const Button& button : buttons_) {
        if (!button.command.isPrimary)
            continue;
        QPalette colors = palette();
        for (const auto group : {QPalette::Active, QPalette::Inactive}) {
            colors.setColor(group, QPalette::Button, colors.color(group, QPalette::Highlight));
            colors.setColor(group, QPalette::ButtonText,
                            colors.color(group, QPalette::HighlightedText));
        }
        button.widget->setPalette(colors);
    }
}

void CommandBar::changeEvent(QEvent* event)
{
    QToolBar::changeEvent(event);
    if (event->type() == QEvent::PaletteChange)
        adoptColors();
}

}  // namespace orvane::desktop
