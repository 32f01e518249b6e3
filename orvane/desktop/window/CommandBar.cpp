// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/window/CommandBar.h"

#include "orvane/desktop/toolkit/Text.h"
#include "orvane/desktop/window/WindowColors.h"

#include <QHBoxLayout>
#include <QStyleOptionToolButton>
#include <QStylePainter>

#include <utility>

namespace orvane::desktop {
namespace {

constexpr int margin = 6;       // pixels
constexpr double rounding = 4;  // pixels

/// A button that stands out: filled, where the others are flat.
class PrimaryButton final : public QToolButton {
public:
    using QToolButton::QToolButton;

    QSize sizeHint() const override { return QToolButton::sizeHint() + QSize(2 * margin, 0); }

protected:
    void paintEvent(QPaintEvent* event) override
    {
        if (!isEnabled()) {
            QToolButton::paintEvent(event);
            return;
        }
        const PrimaryColors colors = primaryColors(palette(), isDown() || underMouse());
        QStylePainter painter(this);
        painter.setRenderHint(QPainter::Antialiasing);
        painter.setPen(hasFocus() ? QPen(palette().color(QPalette::WindowText), 1.5) : Qt::NoPen);
        painter.setBrush(colors.ground);
        painter.drawRoundedRect(QRectF(rect()).adjusted(1, 1, -1, -1), rounding, rounding);
        QStyleOptionToolButton option;
        initStyleOption(&option);
        option.palette.setColor(QPalette::ButtonText, colors.text);
        option.state &= ~(QStyle::State_MouseOver | QStyle::State_Sunken);
        painter.drawControl(QStyle::CE_ToolButtonLabel, option);
    }
};

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
    setCompact(isCompact_);
}

void CommandBar::addButton(BarCommand command)
{
    QToolButton* const button = command.isPrimary ? new PrimaryButton(this) : new QToolButton(this);
    button->setObjectName(QLatin1String(command.command.objectName));
    const QString title = toQt(texts_.text(command.command.title));
    button->setText(toQtTitle(fromQt(title)));
    button->setAccessibleName(title);
    button->setAutoRaise(true);
    button->setFocusPolicy(Qt::TabFocus);
    button->setIcon(symbol(command.symbol));
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
        const bool isAvailable = reason.empty() && (!command.isAvailable || command.isAvailable());
        button.widget->setEnabled(isAvailable);
        // On its filled ground; without that, as all others.
        if (button.command.isPrimary)
            button.widget->setIcon(symbol(button.command.symbol, isAvailable
                                                                     ? QPalette::HighlightedText
                                                                     : QPalette::ButtonText));
        QString toolTip = toQt(texts_.text(command.title));
        if (!command.shortcut.isEmpty())
            toolTip += QStringLiteral(" (") + command.shortcut.toString(QKeySequence::NativeText) +
                       QLatin1Char(')');
        if (!reason.empty())
            toolTip += QStringLiteral("\n\n") + toQt(reason);
        button.widget->setToolTip(toQtToolTip(fromQt(toolTip)));
        // The tool tip is HTML, which must not be read out.
        button.widget->setAccessibleDescription(toolTip);
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

}  // namespace orvane::desktop
