// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/window/Menus.h"
#include "orvane/desktop/window/Symbols.h"

#include <QToolBar>
#include <QToolButton>

#include <vector>

namespace orvane::desktop {

/// A command that is always in sight.
struct BarCommand {
    MenuCommand command;  ///< its title without ampersand; its shortcut is the menu's
    Symbol symbol;
    bool isPrimary = false;  ///< what most people are here for
    bool isAtEnd = false;
};

/// The bar of commands at the top of the window. Main thread.
class CommandBar final : public QToolBar {
public:
    CommandBar(const Translator& texts, QWidget* parent);

    void add(std::vector<BarCommand> commands);
    /// Shows what can be done now, and why not what cannot.
    void refresh();
    /// Where there is little room: the symbols alone, but for the first command.
    void setCompact(bool isCompact);

private:
    struct Button {
        BarCommand command;
        QToolButton* widget;
    };

    void addButton(BarCommand command);

    const Translator& texts_;
    std::vector<Button> buttons_;
    bool isCompact_ = false;
};

}  // namespace orvane::desktop
