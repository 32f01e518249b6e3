// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/DiskCommands.h"
#include "orvane/desktop/WindowDialogs.h"

#include <functional>
#include <string>
#include <string_view>
#include <vector>

namespace orvane::desktop {

/// What the window's menus do. Main thread.
class MenuCommands {
public:
    /// All but `update` outlive this object; it shows what a command has changed.
    MenuCommands(const SessionParts& parts, DiskPane& disks, DiskCommands& diskCommands,
                 WindowDialogs& dialogs, std::function<void()> update)
        : at_(parts),
          disks_(disks),
          diskCommands_(diskCommands),
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
    std::vector<MenuCommand> viewCommands();
    MenuCommand recentCommand();
    MenuCommand findCommand();

    std::string reasonWhileLocked() const;
    bool isLocked() const { return at_.controller.interfaceLock(); }
    void chooseImages(std::string_view title,
                      const std::function<void(const std::vector<std::string>&)>& chosen);
    void openImages();
    void print();
    bool canEdit(contract::Selector action);
    void completeLog();
    bool isInDiskList() const;
    void selectAll();
    void undoClearing();
    void fillRecent(QMenu& menu);

    std::string text(std::string_view key) const { return at_.host.translator().text(key); }

    const SessionParts at_;
    DiskPane& disks_;
    DiskCommands& diskCommands_;
    WindowDialogs& dialogs_;
    const std::function<void()> update_;
};

}  // namespace orvane::desktop
