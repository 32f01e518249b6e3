// SPDX-License-Identifier: Apache-2.0
// What the window's menus do.

#include "orvane/desktop/DesktopSession.h"
#include "orvane/desktop/toolkit/Text.h"

#include <QFile>
#include <QFileDialog>
#include <QMenu>
#include <QMenuBar>

namespace orvane::desktop {
namespace {

constexpr std::string_view fetchesArchivesKey = "fetchesPackageArchives";

}  // namespace

std::vector<Menu> DesktopSession::menus()
{
    const auto isUnlocked = [this] {
        return !controller_.interfaceLock();
    };
    const MenuCommand line{};
    Menu file{
        "&File",
        {{"openImage", "&Open Image…", QKeySequence::Open,
          [this] {
              chooseImages("Open Image", [this](const auto& names) { images_.open(names); });
          },
          isUnlocked},
         {"attachImage",
          "&Attach Image as Device…",
          {},
          [this] {
              chooseImages("Attach Image as Device",
                           [this](const auto& names) { attachAsDevices(names); });
          },
          isUnlocked},
         {"rescan", "&Rescan Disks", QKeySequence::Refresh,
          [this] {
              images_.refreshAll();
              scan_.start();
          },
          isUnlocked},
         diskCommand("mount", "&Mount", QKeySequence(Qt::CTRL | Qt::Key_M), DiskAction::Mount),
         diskCommand("unmount", "&Unmount", QKeySequence(Qt::CTRL | Qt::Key_U),
                     DiskAction::Unmount),
         diskCommand("eject", "&Eject", QKeySequence(Qt::CTRL | Qt::Key_E), DiskAction::Eject),
         line,
         {"print", "&Print…", QKeySequence::Print,
          [this] {
              completeLog();
              activeTab()->module().printModuleSpecific(&window_);
          },
          [this] {
              return activeTab() != nullptr && activeTab()->module().canPrint();
          }},
         line,
         {"quit", "&Quit", QKeySequence(Qt::CTRL | Qt::Key_Q), [this] {
              window_.close();
          }}}};
    Menu edit{"&Edit",
              {{"copy", "&Copy", QKeySequence::Copy, [this] { log()->copy(&window_); },
                [this] {
                    return canEdit("copy:");
                }},
               {"selectAll", "Select &All", QKeySequence::SelectAll, [this] { selectAll(); },
                [this] {
                    return isInDiskList() || canEdit("selectAll:");
                }},
               // The key itself belongs to the log, which sees it first.
               {"delete",
                "&Delete",
                {},
                [this] { log()->delete_(&window_); },
                [this] {
                    return canEdit("delete:");
                }},
               {"undoClear", "&Undo Clear History", QKeySequence::Undo, [this] { undoClearing(); },
                [this] {
                    return !controller_.interfaceLock() && host_.histories().hasCleared();
                }},
               line,
               {"fetchArchives",
                "Download &Package Archives",
                {},
                [this] { switchArchiveFetching(); },
                {},
                [this] {
                    return fetchesArchives();
                }}}};
    Menu disk{"Dis&k",
              {buttonCommand("verifyDisk", "&Verify Disk", "verifyDiskButton"),
               buttonCommand("repairDisk", "&Repair Disk", "repairDiskButton"), line,
               mapCommand("verifyMap", "Verify Partition &Map", "verifyDiskButton"),
               mapCommand("repairMap", "Repair &Partition Map", "repairDiskButton")},
              "diskMenu"};
    Menu view{"&View",
              {{"showDetails", "Show &Details", QKeySequence(Qt::CTRL | Qt::Key_D),
                [this] { detailsButton()->press(); },
                [this] { return detailsButton() != nullptr && detailsButton()->isEnabled(); },
                [this] {
                    return detailsButton() != nullptr && detailsButton()->isChecked();
                }}}};
    Menu help{"&Help", {{"help", "Fixwell &Help", QKeySequence(Qt::Key_F1), [this] {
                             host_.sharedHelpManager().openHelpAnchor("ovhelp11868");
                         }}}};
    return {file, edit, disk, view, help};
}

void DesktopSession::chooseImages(
    std::string_view title, const std::function<void(const std::vector<std::string>&)>& chosen)
{
    auto* const dialog = new QFileDialog(&window_, toQt(text(title)));
    dialog->setAttribute(Qt::WA_DeleteOnClose);
    dialog->setFileMode(QFileDialog::ExistingFiles);
    dialog->setNameFilters(
        {toQt(text("Disk images")) + QStringLiteral(" (*.img *.raw *.iso *.bin)"),
         toQt(text("All files")) + QStringLiteral(" (*)")});
    QObject::connect(dialog, &QFileDialog::filesSelected, &window_,
                     [chosen](const QStringList& files) {
                         std::vector<std::string> names;
                         for (const QString& file : files)
                             names.push_back(QFile::encodeName(file).toStdString());
                         chosen(names);
                     });
    dialog->open();
}

contract::OutlineView* DesktopSession::log()
{
    ModuleTab* const tab = activeTab();
    return tab != nullptr && tab->interface() != nullptr ? tab->interface()->outlineView()
                                                         : nullptr;
}

void DesktopSession::reloadLog()
{
    if (log() != nullptr)
        activeTab()->interface()->outlinePeer()->reloadData();
}

// Who takes the whole log wants the oldest rows, too.
void DesktopSession::completeLog()
{
    if (host_.histories().loadAll())
        reloadLog();
}

std::string DesktopSession::selectionHTML()
{
    return log() != nullptr ? activeTab()->interface()->outlinePeer()->selectionHTML()
                            : std::string();
}

bool DesktopSession::canEdit(contract::Selector action)
{
    return log() != nullptr && log()->validateMenuItem({action});
}

bool DesktopSession::fetchesArchives()
{
    return host_.standardUserDefaults().objectForKey(fetchesArchivesKey).boolean();
}

void DesktopSession::switchArchiveFetching()
{
    host_.standardUserDefaults().setObjectForKey(!fetchesArchives(), fetchesArchivesKey);
}

// The list and the log both have rows; the one that the user is in is meant. Asked of the window,
// which knows it also while its menu is open.
bool DesktopSession::isInDiskList() const
{
    return window_.focusWidget() == &window_.disks();
}

void DesktopSession::selectAll()
{
    if (isInDiskList())
        window_.disks().selectAll();
    else {
        completeLog();
        log()->selectAll(&window_);
    }
}

QtButton* DesktopSession::moduleButton(const char* name)
{
    ModuleTab* const tab = activeTab();
    return tab != nullptr && tab->interface() != nullptr ? tab->interface()->button(name) : nullptr;
}

QtButton* DesktopSession::detailsButton()
{
    return moduleButton("showDetailsButton");
}

void DesktopSession::undoClearing()
{
    host_.histories().restoreCleared();
    window_.disks().synchronize();
    updateTabs();
}

MenuCommand DesktopSession::buttonCommand(const char* objectName, std::string_view title,
                                          const char* button)
{
    return {objectName,
            title,
            {},
            [this, button] { moduleButton(button)->press(); },
            [this, button] {
                QtButton* const control = moduleButton(button);
                return !controller_.interfaceLock() && control != nullptr && control->isEnabled();
            }};
}

MenuCommand DesktopSession::mapCommand(const char* objectName, std::string_view title,
                                       const char* button)
{
    return {objectName,
            title,
            {},
            [this, button] { treatMap(button); },
            [this] {
                return diskWithMap() != nullptr;
            }};
}

// The whole disk that is selected, or that is in the selected image, where a map can be treated.
std::shared_ptr<Disk> DesktopSession::diskWithMap()
{
    const auto disks = window_.disks().selectedDisks();
    if (disks.size() != 1 || controller_.interfaceLock() || activeTab() == nullptr)
        return nullptr;
    const auto whole =
        disks.front()->isOfflineDiskImage() ? disks.front()->contents() : disks.front();
    const bool hasMap = whole && whole->isWhole() && !whole->hasGone() &&
                        library_.reasonAgainstPartitionMap(*whole->theKRDisk()).empty();
    return hasMap ? whole : nullptr;
}

// The module takes the map of what is selected as a whole disk, as it does with a device; of an
// image it takes the volumes.
void DesktopSession::treatMap(const char* button)
{
    controller_.setSelection({diskWithMap()});
    activeTab()->tellOfSelection();
    if (QtButton* const control = moduleButton(button))
        control->press();
    if (controller_.interfaceLock())
        return;  // until the job is over
    controller_.setSelection({});
    updateTabs();
}

void DesktopSession::showDiskMenu(const QPoint& place)
{
    for (QAction* action : window_.menuBar()->actions())
        if (action->menu() != nullptr && action->menu()->objectName() == QLatin1String("diskMenu"))
            action->menu()->popup(window_.disks().viewport()->mapToGlobal(place));
}

}  // namespace orvane::desktop
