// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/DiskCommands.h"

#include <functional>
#include <string>
#include <string_view>
#include <vector>

namespace orvane::desktop {

/// Whether the user agrees that archives of packages are fetched over the network.
[[nodiscard]] bool fetchesArchives(SupportHost& host);

/// Whether a verification that finds nothing tries a repair as well.
[[nodiscard]] bool verifiesThoroughly(SupportHost& host);

/// What the window's menus do. Main thread.
class MenuCommands {
public:
    /// All but `update` outlive this object; it shows what a command has changed.
    MenuCommands(const SessionParts& parts, DiskPane& disks, DiskCommands& diskCommands,
                 std::function<void()> update)
        : at_(parts), disks_(disks), diskCommands_(diskCommands), update_(std::move(update))
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
    MenuCommand settingCommand(const char* objectName, std::string_view title,
                               std::string_view key);
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
    const std::function<void()> update_;
};

}  // namespace orvane::desktop
