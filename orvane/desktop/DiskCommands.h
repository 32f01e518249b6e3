// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/DiskPane.h"
#include "orvane/desktop/ModuleTabs.h"
#include "orvane/desktop/RepairChoices.h"
#include "orvane/desktop/RepairUndoing.h"
#include "orvane/desktop/session/FileManager.h"
#include "orvane/desktop/window/DiskProperties.h"
#include "orvane/desktop/window/Menus.h"

#include <functional>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

namespace orvane::desktop {

/// What can be done with the disks that are selected: the Disk menu, and what others show of it.
/// Main thread.
class DiskCommands {
public:
    /// All but `update` outlive this object; `update` shows what a command has changed.
    DiskCommands(const SessionParts& parts, DiskPane& disks, const pellar::Manager& library,
                 RepairChoices& choices, RepairUndoing& undoing, FileManager& files,
                 std::function<void()> update)
        : at_(parts),
          disks_(disks),
          library_(library),
          choices_(choices),
          undoing_(undoing),
          files_(files),
          update_(std::move(update))
    {
    }
    DiskCommands(const DiskCommands&) = delete;
    DiskCommands& operator=(const DiskCommands&) = delete;

    std::vector<MenuCommand> all();
    static QKeySequence stopShortcut() { return {Qt::CTRL | Qt::Key_Period}; }
    /// Not QKeySequence::Close, which is Ctrl+F4 on a desktop without a theme of its own.
    static QKeySequence closeShortcut() { return {Qt::CTRL | Qt::Key_W}; }

    // Some of them, to be shown elsewhere as well. Those that are not asked for an object's name
    // and a title have that of the menu.

    /// Presses a button of the module.
    MenuCommand button(const char* objectName, std::string_view title, std::string_view button);
    MenuCommand preview();
    MenuCommand undo(const char* objectName, std::string_view title, pellar::Operation operation,
                     RepairUndoing::Scope scope = RepairUndoing::Scope::Disk);
    MenuCommand stop(const char* objectName, std::string_view title);
    MenuCommand closeImage(const char* objectName);

    /// Shows all that is known of the one disk that is selected.
    void showProperties();

private:
    MenuCommand map(const char* objectName, std::string_view title, std::string_view button);
    MenuCommand action(const char* objectName, std::string_view title, QKeySequence shortcut,
                       DiskAction action);
    MenuCommand attach();
    MenuCommand showInFiles();
    MenuCommand copyReport();
    MenuCommand properties();

    bool isLocked() const { return at_.controller.interfaceLock(); }
    /// Why none of it is possible now, whatever the command is about; empty when it may be.
    std::string reasonAgainstAll() const;
    std::string reasonAgainstButton(std::string_view button);
    std::string reasonAgainstMap();
    std::string reasonAgainstImages() const;
    std::filesystem::path placeOfSelection() const;
    std::vector<NamedCheck> runsOf(const std::shared_ptr<Disk>& disk);
    std::string report();
    std::shared_ptr<Disk> diskWithMap();
    void treatMap(std::string_view button);

    std::string text(std::string_view key) const { return at_.host.translator().text(key); }

    const SessionParts at_;
    DiskPane& disks_;
    const pellar::Manager& library_;
    RepairChoices& choices_;
    RepairUndoing& undoing_;
    FileManager& files_;
    const std::function<void()> update_;
};

}  // namespace orvane::desktop
