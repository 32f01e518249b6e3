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
}

void MenuCommands::fillBar()
{
    const auto action = [this](const char* objectName, std::string_view title,
                               std::string_view button) {
        return MenuCommand{.objectName = objectName,
                           .title = title,
                           .shortcut = shortcutOf(button),
                           .perform = [this, button] { at_.tabs.button(button)->press(); },
                           .reasonAgainst = [this, button] { return reasonAgainstButton(button); }};
    };
    const auto stop = MenuCommand{
        .objectName = "barStop",
        .title = "Stop",
        .shortcut = {},
        .perform = [this] { at_.tabs.stopJob(); },
        .reasonAgainst = [this] { return isLocked() ? "" : text("No job runs."); }};
    const auto open = MenuCommand{.objectName = "barOpen",
                                  .title = "Open Image…",
                                  .shortcut = QKeySequence::Open,
                                  .perform = [this] { openImages(); },
                                  .isAvailable = [this] { return !isLocked(); }};
    auto preview = previewCommand();
    preview.objectName = "barPreview";
    preview.title = "Preview";
    auto undo = undoCommand("barUndo", "Undo", pellar::Operation::Undo);
    at_.window.commands().add(
        {{action("barVerify", "Verify", outlet::verifyDisk), Symbol::Verify, true},
         {action("barRepair", "Repair", outlet::repairDisk), Symbol::Repair},
         {std::move(preview), Symbol::Preview},
         {std::move(undo), Symbol::Undo},
         {stop, Symbol::Stop},
         {open, Symbol::Open, false, true}});
}

QKeySequence MenuCommands::shortcutOf(std::string_view button)
{
    const QtButton* const control = at_.tabs.button(button);
    return control != nullptr ? control->widget().shortcut() : QKeySequence();
}

std::string MenuCommands::reasonAgainstButton(std::string_view button)
{
    const QtButton* const control = at_.tabs.button(button);
    if (control == nullptr)
        return text("Not available for this disk.");
    if (isLocked())
        return text("Not available while a job runs.");
    if (control->isEnabled())
        return {};
    return control->reason().empty() ? text("Not available for this disk.") : control->reason();
}

std::vector<Menu> MenuCommands::menus()
{
    return {{"&File", fileCommands()},
            {"&Edit", editCommands()},
            {"Dis&k", diskCommands(), diskMenu},
            {"&View", {detailsCommand()}},
            {"&Help", {{"help", "Fixwell &Help", QKeySequence(Qt::Key_F1), [this] {
                            at_.host.sharedHelpManager().openHelpAnchor("ovhelp11868");
                        }},
                        {"about", "&About Orvane", {}, [this] { dialogs_.showAbout(); }}}}};
}

std::vector<MenuCommand> MenuCommands::fileCommands()
{
    const auto isFree = [this] {
        return !isLocked();
    };
    const auto attach = [this] {
        chooseImages("Attach Image as Device",
                     [this](const auto& names) { disks_.attachAsDevices(names); });
    };
    const auto canPrint = [this] {
        return at_.tabs.active() != nullptr && at_.tabs.active()->module().canPrint();
    };
    return {
        {"openImage", "&Open Image…", QKeySequence::Open, [this] { openImages(); }, isFree},
        {"attachImage", "&Attach Image as Device…", {}, attach, isFree},
        {"rescan", "&Rescan Disks", QKeySequence::Refresh, [this] { disks_.rescan(); }, isFree},
        diskCommand("mount", "&Mount", QKeySequence(Qt::CTRL | Qt::Key_M), DiskAction::Mount),
        diskCommand("unmount", "&Unmount", QKeySequence(Qt::CTRL | Qt::Key_U), DiskAction::Unmount),
        diskCommand("eject", "&Eject", QKeySequence(Qt::CTRL | Qt::Key_E), DiskAction::Eject),
        line,
        {"saveReport", "&Save Report…", QKeySequence::Save, [this] { dialogs_.saveReport(); },
         [this] { return dialogs_.canSaveReport(); }},
        {"print", "&Print…", QKeySequence::Print, [this] { print(); }, canPrint},
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
        {"preferences", "&Preferences…", QKeySequence(Qt::CTRL | Qt::Key_Comma),
         [this] { dialogs_.showPreferences(); }}};
}

std::vector<MenuCommand> MenuCommands::diskCommands()
{
    return {buttonCommand("verifyDisk", "&Verify Disk", outlet::verifyDisk),
            buttonCommand("repairDisk", "&Repair Disk", outlet::repairDisk),
            previewCommand(),
            line,
            undoCommand("undoRepair", "&Undo Repair…", pellar::Operation::Undo),
            undoCommand("finishRepair", "&Finish Repair…", pellar::Operation::Finish),
            undoCommand("undoPermissions", "Undo Permi&ssions Repair…", pellar::Operation::Undo,
                        RepairUndoing::Scope::Permissions),
            line,
            mapCommand("verifyMap", "Verify Partition &Map", outlet::verifyDisk),
            mapCommand("repairMap", "Repair &Partition Map", outlet::repairDisk)};
}

MenuCommand MenuCommands::previewCommand()
{
    return {.objectName = "previewRepair",
            .title = "Previe&w Repair",
            .shortcut = {},
            .perform = [this] { choices_.preview(); },
            .reasonAgainst = [this] { return choices_.reasonAgainstPreview(); }};
}

MenuCommand MenuCommands::undoCommand(const char* objectName, std::string_view title,
                                      pellar::Operation operation, RepairUndoing::Scope scope)
{
    return {.objectName = objectName,
            .title = title,
            .shortcut = {},
            .perform = [this, operation, scope] { undoing_.ask(operation, scope); },
            .reasonAgainst =
                [this, operation, scope] {
                    return undoing_.reasonAgainst(operation, scope);
                }};
}

MenuCommand MenuCommands::detailsCommand()
{
    const auto button = [this] {
        return at_.tabs.button(outlet::showDetails);
    };
    return {"showDetails",
            "Show &Details",
            QKeySequence(Qt::CTRL | Qt::Key_D),
            [button] { button()->press(); },
            [button] { return button() != nullptr && button()->isEnabled(); },
            [button] {
                return button() != nullptr && button()->isChecked();
            }};
}

MenuCommand MenuCommands::diskCommand(const char* objectName, std::string_view title,
                                      QKeySequence shortcut, DiskAction action)
{
    // While a job runs, the disks are its own.
    return {objectName, title, std::move(shortcut),
            [this, action] { disks_.doToSelection(action); },
            [this, action] {
                return !isLocked() && disks_.canDo(action);
            }};
}

MenuCommand MenuCommands::buttonCommand(const char* objectName, std::string_view title,
                                        std::string_view button)
{
    return {objectName,
            title,
            {},
            [this, button] { at_.tabs.button(button)->press(); },
            [this, button] {
                const QtButton* const control = at_.tabs.button(button);
                return !isLocked() && control != nullptr && control->isEnabled();
            }};
}

MenuCommand MenuCommands::mapCommand(const char* objectName, std::string_view title,
                                     std::string_view button)
{
    return {objectName,
            title,
            {},
            [this, button] { treatMap(button); },
            [this] {
                return diskWithMap() != nullptr;
            }};
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

// The whole disk that is selected, or that is in the selected image, where a map can be treated.
std::shared_ptr<Disk> MenuCommands::diskWithMap()
{
    const auto disks = disks_.selected();
    if (disks.size() != 1 || isLocked() || at_.tabs.active() == nullptr)
        return nullptr;
    const auto whole =
        disks.front()->isOfflineDiskImage() ? disks.front()->contents() : disks.front();
    const bool hasMap = whole && whole->isWhole() && !whole->hasGone() &&
                        library_.reasonAgainstPartitionMap(*whole->theKRDisk()).empty();
    return hasMap ? whole : nullptr;
}

// The module takes the map of what is selected as a whole disk, as it does with a device; of an
// image it takes the volumes.
void MenuCommands::treatMap(std::string_view button)
{
    at_.controller.setSelection({diskWithMap()});
    at_.tabs.active()->tellOfSelection();
    if (QtButton* const control = at_.tabs.button(button))
        control->press();
    if (isLocked())
        return;  // until the job is over
    at_.controller.setSelection({});
    update_();
}

}  // namespace orvane::desktop
