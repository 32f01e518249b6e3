// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/DiskPane.h"
#include "orvane/desktop/ModuleTabs.h"
#include "orvane/desktop/RepairChoices.h"
#include "orvane/desktop/RepairUndoing.h"
#include "orvane/desktop/WindowDialogs.h"
#include "orvane/desktop/window/Menus.h"

#include <functional>
#include <string>
#include <string_view>
#include <vector>

namespace orvane::desktop {

/// What the window's menus do. Main thread.
class MenuCommands {
public:
    /// All but `update` outlive this object; it shows what a command has changed.
    MenuCommands(const SessionParts& parts, DiskPane& disks, const pellar::Manager& library,
                 RepairChoices& choices, RepairUndoing& undoing, WindowDialogs& dialogs,
                 std::function<void()> update)
        : at_(parts),
          disks_(disks),
          library_(library),
          choices_(choices),
          undoing_(undoing),
          dialogs_(dialogs),
          update_(std::move(update))
    {
    }
    MenuCommands(const MenuCommands&) = delete;
    MenuCommands& operator=(const MenuCommands&) = delete;

    /// Gives the window its menus, and the list of disks one of them as its own.
    void addMenus();
    /// Fills the bar at the top of the window.
    void fillBar();

private:
    std::vector<Menu> menus();
    std::vector<MenuCommand> fileCommands();
    std::vector<MenuCommand> editCommands();
    std::vector<MenuCommand> diskCommands();
    MenuCommand detailsCommand();
    MenuCommand previewCommand();
    MenuCommand undoCommand(const char* objectName, std::string_view title,
                            pellar::Operation operation,
                            RepairUndoing::Scope scope = RepairUndoing::Scope::Disk);
    MenuCommand diskCommand(const char* objectName, std::string_view title, QKeySequence shortcut,
                            DiskAction action);
    MenuCommand buttonCommand(const char* objectName, std::string_view title,
                              std::string_view button);
    MenuCommand mapCommand(const char* objectName, std::string_view title, std::string_view button);

    bool isLocked() const { return at_.controller.interfaceLock(); }
    void chooseImages(std::string_view title,
                      const std::function<void(const std::vector<std::string>&)>& chosen);
    void openImages();
    QKeySequence shortcutOf(std::string_view button);
    std::string reasonAgainstButton(std::string_view button);
    void print();
    bool canEdit(contract::Selector action);
    void completeLog();
    bool isInDiskList() const;
    void selectAll();
    void undoClearing();
    std::shared_ptr<Disk> diskWithMap();
    void treatMap(std::string_view button);

    std::string text(std::string_view key) const { return at_.host.translator().text(key); }

    const SessionParts at_;
    DiskPane& disks_;
    const pellar::Manager& library_;
    RepairChoices& choices_;
    RepairUndoing& undoing_;
    WindowDialogs& dialogs_;
    const std::function<void()> update_;
};

}  // namespace orvane::desktop
