// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/MenuCommands.h"

#include "contract/toolkit/ControlNames.h"
#include "orvane/desktop/toolkit/Text.h"

#include <QFile>
#include <QFileDialog>
#include <QMenu>
#include <QMenuBar>

#include <utility>

namespace orvane::desktop {

namespace outlet = contract::outlet;

namespace {

constexpr const char* diskMenu = "diskMenu";
const MenuCommand line{};

}  // namespace

void MenuCommands::addMenus()
{
    desktop::addMenus(at_.window, menus(), at_.host.translator());
    DiskList& list = disks_.list();
    list.setContextMenuPolicy(Qt::CustomContextMenu);
    QObject::connect(
        &list, &QWidget::customContextMenuRequested, &at_.window,
        [&list, menu = at_.window.menuBar()->findChild<QMenu*>(QLatin1String(diskMenu))](
            const QPoint& place) { menu->popup(list.viewport()->mapToGlobal(place)); });
    list.events().opened = [this] {
        diskCommands_.showProperties();
    };
    list.events().openImage = [this] {
        if (!isLocked())
            openImages();
    };
}

void MenuCommands::fillBar()
{
    const auto open = MenuCommand{.objectName = "barOpen",
                                  .title = "Open Image…",
                                  .shortcut = QKeySequence::Open,
                                  .perform = [this] { openImages(); },
                                  .reasonAgainst =
                                      [this] {
                                          return reasonWhileLocked();
                                      }};
    auto verify = diskCommands_.button("barVerify", "Verify", outlet::verifyDisk);
    verify.shortcut = verify.shownShortcut;
    auto repair = diskCommands_.button("barRepair", "Repair", outlet::repairDisk);
    repair.shortcut = repair.shownShortcut;
    auto preview = diskCommands_.preview();
    preview.objectName = "barPreview";
    preview.title = "Preview";
    auto stop = diskCommands_.stop("barStop", "Stop");
    stop.shortcut = DiskCommands::stopShortcut();
    at_.window.commands().add(
        {{std::move(verify), Symbol::Verify, true},
         {std::move(repair), Symbol::Repair},
         {std::move(preview), Symbol::Preview},
         {diskCommands_.undo("barUndo", "Undo", pellar::Operation::Undo), Symbol::Undo},
         {std::move(stop), Symbol::Stop},
         {open, Symbol::Open, false, true}});
}

std::vector<Menu> MenuCommands::menus()
{
    return {{"&File", fileCommands()},
            {"&Edit", editCommands()},
            {"Dis&k", diskCommands_.all(), diskMenu},
            {"&View", viewCommands()},
            {"&Help",
             {{"help", "Fixwell &Help", QKeySequence(Qt::Key_F1),
               [this] {
                   at_.host.sharedHelpManager().openHelpAnchor("ovhelp11868");
               }},
              {"about", "&About Orvane", {}, [this] {
                   dialogs_.showAbout();
               }}}}};
}

std::vector<MenuCommand> MenuCommands::fileCommands()
{
    // While a job runs, the list is its own.
    const auto whenFree = [this](const char* objectName, std::string_view title,
                                 QKeySequence shortcut, std::function<void()> perform) {
        return MenuCommand{.objectName = objectName,
                           .title = title,
                           .shortcut = std::move(shortcut),
                           .perform = std::move(perform),
                           .reasonAgainst = [this] {
                               return reasonWhileLocked();
                           }};
    };
    const auto attach = [this] {
        chooseImages("Attach Image as Device",
                     [this](const auto& names) { disks_.attachAsDevices(names); });
    };
    const auto reasonAgainstPrinting = [this] {
        const bool canPrint =
            at_.tabs.active() != nullptr && at_.tabs.active()->module().canPrint();
        return canPrint ? std::string() : text("There is no log to print.");
    };
    // The Disk menu has the key.
    MenuCommand closing = diskCommands_.closeImage("closeImageInFile");
    closing.shownShortcut = DiskCommands::closeShortcut();
    return {whenFree("openImage", "&Open Image…", QKeySequence::Open, [this] { openImages(); }),
            recentCommand(),
            std::move(closing),
            {.objectName = "reopenClosed",
             .title = "R&eopen Closed Image",
             .shortcut = QKeySequence(Qt::CTRL | Qt::SHIFT | Qt::Key_T),
             .perform = [this] { disks_.open(disks_.closedImages()); },
             .reasonAgainst =
                 [this] {
                     const std::string reason = reasonWhileLocked();
                     return !reason.empty() || !disks_.closedImages().empty()
                                ? reason
                                : text("No image was closed since this window opened.");
                 }},
            whenFree("attachImage", "&Attach Image as Device…", {}, attach),
            whenFree("rescan", "&Rescan Disks", QKeySequence::Refresh, [this] { disks_.rescan(); }),
            line,
            {"saveReport", "&Save Report…", QKeySequence::Save, [this] { dialogs_.saveReport(); },
             [this] {
                 return dialogs_.canSaveReport();
             }},
            {.objectName = "print",
             .title = "&Print…",
             .shortcut = QKeySequence::Print,
             .perform = [this] { print(); },
             .reasonAgainst = reasonAgainstPrinting},
            line,
            {"quit", "&Quit", QKeySequence(Qt::CTRL | Qt::Key_Q), [this] {
                 at_.window.close();
             }}};
}

std::vector<MenuCommand> MenuCommands::editCommands()
{
    const auto edits = [this](contract::Selector action) {
        return [this, action] {
            return canEdit(action);
        };
    };
    const auto canSelect = [this] {
        return isInDiskList() || canEdit("selectAll:");
    };
    const auto canUndo = [this] {
        return !isLocked() && at_.host.histories().hasCleared();
    };
    const auto copy = [this] {
        at_.tabs.log()->copy(&at_.window);
    };
    const auto remove = [this] {
        at_.tabs.log()->delete_(&at_.window);
    };
    return {
        {"copy", "&Copy", QKeySequence::Copy, copy, edits("copy:")},
        {"selectAll", "Select &All", QKeySequence::SelectAll, [this] { selectAll(); }, canSelect},
        // The key itself belongs to the log, which sees it first.
        {"delete", "&Delete", {}, remove, edits("delete:")},
        {"undoClear", "&Undo Clear History", QKeySequence::Undo, [this] { undoClearing(); },
         canUndo},
        line,
        findCommand(),
        line,
        {"preferences", "&Preferences…", QKeySequence(Qt::CTRL | Qt::Key_Comma), [this] {
             dialogs_.showPreferences();
         }}};
}

// The key is the search's own.
MenuCommand MenuCommands::findCommand()
{
    const auto search = [this] {
        return at_.tabs.interface() != nullptr ? at_.tabs.interface()->search() : nullptr;
    };
    return {.objectName = "findInLog",
            .title = "&Find in the Log",
            .shortcut = {},
            .perform = [search] { search()->open(); },
            .isAvailable = [search] { return search() != nullptr; },
            .shownShortcut = QKeySequence(Qt::CTRL | Qt::Key_F)};
}

std::string MenuCommands::reasonWhileLocked() const
{
    return isLocked() ? text("Not available while a job runs.") : std::string();
}

MenuCommand MenuCommands::recentCommand()
{
    return {.objectName = "openRecent",
            .title = "Open Recen&t",
            .shortcut = {},
            .perform = {},
            .reasonAgainst =
                [this] {
                    if (isLocked())
                        return reasonWhileLocked();
                    return disks_.recentImages().empty() ? text("No other image was opened before.")
                                                         : "";
                },
            .fill =
                [this](QMenu& menu) {
                    fillRecent(menu);
                }};
}

// The number in front is the key to press; the tenth has the last digit.
void MenuCommands::fillRecent(QMenu& menu)
{
    int number = 0;
    for (const std::string& image : disks_.recentImages()) {
        const QString name = toQtLine(std::filesystem::path(image).filename().native());
        const QString digit = QString::number(++number % 10);
        QAction* const action =
            menu.addAction(QLatin1Char('&') + digit + QLatin1Char(' ') + toQtTitle(fromQt(name)));
        action->setToolTip(toQtToolTip(image));
        QObject::connect(action, &QAction::triggered, &at_.window,
                         [this, image] { disks_.openRecent(image); });
    }
    menu.addSeparator();
    QAction* const clear = menu.addAction(toQt(text("C&lear This List")));
    clear->setObjectName(QStringLiteral("clearRecent"));
    QObject::connect(clear, &QAction::triggered, &at_.window,
                     [this] { disks_.forgetRecentImages(); });
}

std::vector<MenuCommand> MenuCommands::viewCommands()
{
    const auto button = [this] {
        return at_.tabs.button(outlet::showDetails);
    };
    return {{"showDetails", "Show &Details", QKeySequence(Qt::CTRL | Qt::Key_D),
             [button] { button()->press(); },
             [button] { return button() != nullptr && button()->isEnabled(); },
             [button] {
                 return button() != nullptr && button()->isChecked();
             }},
            {"filterDisks", "&Filter Disks", QKeySequence(Qt::CTRL | Qt::Key_L), [this] {
                 at_.window.diskPanel().search();
             }}};
}

void MenuCommands::openImages()
{
    chooseImages("Open Image", [this](const auto& names) { disks_.open(names); });
}

void MenuCommands::chooseImages(std::string_view title,
                                const std::function<void(const std::vector<std::string>&)>& chosen)
{
    const Translator& texts = at_.host.translator();
    auto* const dialog = new QFileDialog(&at_.window, toQt(texts.text(title)));
    dialog->setAttribute(Qt::WA_DeleteOnClose);
    dialog->setFileMode(QFileDialog::ExistingFiles);
    dialog->setNameFilters(
        {toQt(texts.text("Disk images")) + QStringLiteral(" (*.img *.raw *.iso *.bin)"),
         toQt(texts.text("All files")) + QStringLiteral(" (*)")});
    QObject::connect(dialog, &QFileDialog::filesSelected, &at_.window,
                     [chosen](const QStringList& files) {
                         std::vector<std::string> names;
                         for (const QString& file : files)
                             names.push_back(QFile::encodeName(file).toStdString());
                         chosen(names);
                     });
    dialog->open();
}

void MenuCommands::print()
{
    completeLog();
    at_.tabs.active()->module().printModuleSpecific(&at_.window);
}

bool MenuCommands::canEdit(contract::Selector action)
{
    return at_.tabs.log() != nullptr && at_.tabs.log()->validateMenuItem({action});
}

// Who takes the whole log wants the oldest rows, too.
void MenuCommands::completeLog()
{
    if (at_.host.histories().loadAll())
        at_.tabs.reloadLog();
}

// The list and the log both have rows; the one that the user is in is meant. Asked of the window,
// which knows it also while its menu is open.
bool MenuCommands::isInDiskList() const
{
    return at_.window.focusWidget() == &disks_.list();
}

void MenuCommands::selectAll()
{
    if (isInDiskList()) {
        disks_.list().selectAll();
        return;
    }
    completeLog();
    at_.tabs.log()->selectAll(&at_.window);
}

void MenuCommands::undoClearing()
{
    at_.host.histories().restoreCleared();
    disks_.list().synchronize();
    update_();
}

}  // namespace orvane::desktop
