// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/texts/Catalogue.h"

#include <QAction>
#include <QMainWindow>
#include <QMenu>

#include <functional>
#include <string>
#include <vector>

namespace orvane::desktop {

/// One command of the menus.
struct MenuCommand {
    const char* objectName;  ///< also finds the command in the window
    std::string_view title;  ///< English, with an ampersand before the letter to underline
    QKeySequence shortcut;   ///< empty for none
    std::function<void()> perform;
    /// Asked when the menu opens and when the command is given; YES when empty.
    std::function<bool()> isAvailable = {};
    /// For a command that is a switch: its state, asked when the menu opens.
    std::function<bool()> isOn = {};
    /// Why the command cannot be given, in the user's language: its tool tip while it is grey.
    /// Asked as `isAvailable` is, and beside it; empty when it can.
    std::function<std::string()> reasonAgainst = {};
    /// For a command that is a menu of its own: fills it each time that it opens.
    std::function<void(QMenu& menu)> fill = {};
    /// Shown, and not heard: a button in the window has it, or the same command in another menu.
    QKeySequence shownShortcut = {};
};

/// A menu of the window's menu bar; a command without a title is a line between others.
struct Menu {
    std::string_view title;
    std::vector<MenuCommand> commands;
    const char* objectName = "";
};

/// Gives the window a menu bar. Whether a command is available is found out when it matters:
/// while no menu is open every shortcut works, and asks first.
void addMenus(QMainWindow& window, const std::vector<Menu>& menus, const Translator& texts);

}  // namespace orvane::desktop
