// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/window/Menus.h"

#include "orvane/desktop/toolkit/Text.h"

#include <QMenu>
#include <QMenuBar>
#include <QTimer>
#include <QToolTip>

namespace orvane::desktop {
namespace {

std::string reasonAgainst(const MenuCommand& command)
{
    return command.reasonAgainst ? command.reasonAgainst() : std::string();
}

bool isAvailable(const MenuCommand& command)
{
    return (!command.isAvailable || command.isAvailable()) && reasonAgainst(command).empty();
}

void prepare(const MenuCommand& command, QAction& action)
{
    action.setEnabled(isAvailable(command));
    if (command.reasonAgainst)
        action.setToolTip(toQtToolTip(reasonAgainst(command)));
    if (command.isOn)
        action.setChecked(command.isOn());
}

void perform(const MenuCommand& command, QAction& action)
{
    if (isAvailable(command))
        command.perform();
    if (command.isOn)
        action.setChecked(command.isOn());
}

QAction* addSubmenu(QMenu& menu, const MenuCommand& command, const QString& title)
{
    QMenu* const submenu = menu.addMenu(title);
    submenu->setToolTipsVisible(true);
    QObject::connect(submenu, &QMenu::aboutToShow, submenu, [submenu, fill = command.fill] {
        submenu->clear();
        fill(*submenu);
    });
    return submenu->menuAction();
}

QString titleOf(const MenuCommand& command, const Translator& texts)
{
    const QString title = toQt(texts.text(command.title));
    return command.shownShortcut.isEmpty()
               ? title
               : title + QLatin1Char('\t') +
                     command.shownShortcut.toString(QKeySequence::NativeText);
}

void addCommand(QMenu& menu, const MenuCommand& command, const Translator& texts)
{
    if (command.title.empty()) {
        menu.addSeparator();
        return;
    }
    const QString title = titleOf(command, texts);
    QAction* const action = command.fill ? addSubmenu(menu, command, title) : menu.addAction(title);
    action->setObjectName(QLatin1String(command.objectName));
    action->setShortcut(command.shortcut);
    action->setCheckable(static_cast<bool>(command.isOn));
    if (!command.fill)
        QObject::connect(action, &QAction::triggered, action,
                         [command, action] { perform(command, *action); });
    QObject::connect(&menu, &QMenu::aboutToShow, action,
                     [command, action] { prepare(command, *action); });
    // A disabled action would not hear its shortcut.
    QObject::connect(
        &menu, &QMenu::aboutToHide, action, [action] { action->setEnabled(true); },
        Qt::QueuedConnection);
}

/// Why a command is grey, for those who come to it with the arrow keys: the pointer shows it by
/// itself.
void tellWhyGrey(QMenu& menu, QAction* action)
{
    const QRect place = menu.actionGeometry(action);
    if (action->isEnabled() || place.contains(menu.mapFromGlobal(QCursor::pos())))
        return;
    // Once the menu has settled: what happens to it until then hides a tool tip.
    QTimer::singleShot(0, action, [&menu, action, place] {
        if (menu.activeAction() == action)
            QToolTip::showText(menu.mapToGlobal(place.bottomLeft()), action->toolTip(), &menu);
    });
}

}  // namespace

void addMenus(QMainWindow& window, const std::vector<Menu>& menus, const Translator& texts)
{
    for (const Menu& menu : menus) {
        QMenu* const added = window.menuBar()->addMenu(toQt(texts.text(menu.title)));
        added->setObjectName(QLatin1String(menu.objectName));
        added->setToolTipsVisible(true);
        QObject::connect(added, &QMenu::hovered, added,
                         [added](QAction* action) { tellWhyGrey(*added, action); });
        for (const MenuCommand& command : menu.commands)
            addCommand(*added, command, texts);
    }
}

}  // namespace orvane::desktop
