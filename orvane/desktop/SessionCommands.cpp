// SPDX-License-Identifier: Apache-2.0
// What the window's menus do.

#include "orvane/desktop/DesktopSession.h"
#include "orvane/desktop/toolkit/Text.h"

#include <QFile>
#include <QFileDialog>

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
        {{"openImage", "&Open Image…", QKeySequence::Open, [this] { chooseImages(); }, isUnlocked},
         {"rescan", "&Rescan Disks", QKeySequence::Refresh, [this] { scan_.start(); }, isUnlocked},
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
               line,
               {"fetchArchives",
                "Download &Package Archives",
                {},
                [this] { switchArchiveFetching(); },
                {},
                [this] {
                    return fetchesArchives();
                }}}};
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
    return {file, edit, view, help};
}

void DesktopSession::chooseImages()
{
    auto* const dialog = new QFileDialog(&window_, toQt(text("Open Image")));
    dialog->setAttribute(Qt::WA_DeleteOnClose);
    dialog->setFileMode(QFileDialog::ExistingFiles);
    dialog->setNameFilters(
        {toQt(text("Disk images")) + QStringLiteral(" (*.img *.raw *.iso *.bin)"),
         toQt(text("All files")) + QStringLiteral(" (*)")});
    QObject::connect(dialog, &QFileDialog::filesSelected, &window_,
                     [this](const QStringList& files) {
                         std::vector<std::string> names;
                         for (const QString& file : files)
                             names.push_back(QFile::encodeName(file).toStdString());
                         images_.open(names);
                     });
    dialog->open();
}

fixwell::OutlineView* DesktopSession::log()
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

bool DesktopSession::canEdit(fixwell::Selector action)
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

QtButton* DesktopSession::detailsButton()
{
    ModuleTab* const tab = activeTab();
    return tab != nullptr && tab->interface() != nullptr
               ? tab->interface()->button("showDetailsButton")
               : nullptr;
}

}  // namespace orvane::desktop
