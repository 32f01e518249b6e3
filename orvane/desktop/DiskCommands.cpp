// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/DiskCommands.h"

#include "contract/toolkit/ControlNames.h"
#include "orvane/desktop/toolkit/Text.h"
#include "orvane/desktop/window/PropertiesDialog.h"
#include "orvane/jobs/UnavailableReason.h"

#include <QApplication>
#include <QClipboard>

#include <algorithm>
#include <utility>

namespace orvane::desktop {

namespace outlet = contract::outlet;

namespace {

const MenuCommand line{};
constexpr std::size_t mostRunsShown = 5;

}  // namespace

std::vector<MenuCommand> DiskCommands::all()
{
    MenuCommand stopping = stop("stopJob", "&Stop");
    stopping.shortcut = stopShortcut();
    MenuCommand closing = closeImage("closeImage");
    closing.shortcut = closeShortcut();
    return {button("verifyDisk", "&Verify Disk", outlet::verifyDisk),
            button("repairDisk", "&Repair Disk…", outlet::repairDisk),
            preview(),
            undo("undoRepair", "&Undo Repair…", pellar::Operation::Undo),
            undo("finishRepair", "&Finish Repair…", pellar::Operation::Finish),
            undo("undoPermissions", "Un&do Permissions Repair…", pellar::Operation::Undo,
                 RepairUndoing::Scope::Permissions),
            std::move(stopping),
            line,
            map("verifyMap", "Verify Partition &Map", outlet::verifyDisk),
            map("repairMap", "Repair &Partition Map", outlet::repairDisk),
            line,
            action("mount", "Mou&nt", QKeySequence(Qt::CTRL | Qt::Key_M), DiskAction::Mount),
            action("unmount", "Unmoun&t", QKeySequence(Qt::CTRL | Qt::Key_U), DiskAction::Unmount),
            action("eject", "&Eject", QKeySequence(Qt::CTRL | Qt::Key_E), DiskAction::Eject),
            attach(),
            std::move(closing),
            line,
            showInFiles(),
            copyReport(),
            properties()};
}

MenuCommand DiskCommands::button(const char* objectName, std::string_view title,
                                 std::string_view button)
{
    const QtButton* const control = at_.tabs.button(button);
    return {.objectName = objectName,
            .title = title,
            .shortcut = {},
            .perform = [this, button] { at_.tabs.button(button)->press(); },
            .reasonAgainst = [this, button] { return reasonAgainstButton(button); },
            .shownShortcut = control != nullptr ? control->widget().shortcut() : QKeySequence()};
}

MenuCommand DiskCommands::preview()
{
    return {.objectName = "previewRepair",
            .title = "Previe&w Repair",
            .shortcut = {},
            .perform = [this] { choices_.preview(); },
            .reasonAgainst =
                [this] {
                    // Where its button is grey, for the button's reason.
                    const std::string reason = choices_.reasonAgainstPreview();
                    const std::string button = reasonAgainstButton(outlet::repairDisk);
                    return reason.empty() || button.empty() ? reason : button;
                }};
}

MenuCommand DiskCommands::undo(const char* objectName, std::string_view title,
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

MenuCommand DiskCommands::stop(const char* objectName, std::string_view title)
{
    return {.objectName = objectName,
            .title = title,
            .shortcut = {},
            .perform = [this] { at_.tabs.stopJob(); },
            .reasonAgainst =
                [this] {
                    return isLocked() ? "" : text("No job runs.");
                }};
}

MenuCommand DiskCommands::map(const char* objectName, std::string_view title,
                              std::string_view button)
{
    return {.objectName = objectName,
            .title = title,
            .shortcut = {},
            .perform = [this, button] { treatMap(button); },
            .reasonAgainst =
                [this] {
                    return reasonAgainstMap();
                }};
}

MenuCommand DiskCommands::action(const char* objectName, std::string_view title,
                                 QKeySequence shortcut, DiskAction action)
{
    // While a job runs, the disks are its own.
    return {.objectName = objectName,
            .title = title,
            .shortcut = std::move(shortcut),
            .perform = [this, action] { disks_.doToSelection(action); },
            .reasonAgainst =
                [this, action] {
                    const std::string reason = reasonAgainstAll();
                    return reason.empty() ? disks_.reasonAgainst(action) : reason;
                }};
}

MenuCommand DiskCommands::attach()
{
    return {.objectName = "attachSelected",
            .title = "&Attach as Device",
            .shortcut = {},
            .perform = [this] { disks_.attachAsDevices(disks_.selectedImages()); },
            .reasonAgainst =
                [this] {
                    return reasonAgainstImages();
                }};
}

MenuCommand DiskCommands::closeImage(const char* objectName)
{
    return {.objectName = objectName,
            .title = "&Close Image",
            .shortcut = {},
            .perform = [this] { disks_.closeSelectedImages(); },
            .reasonAgainst =
                [this] {
                    return reasonAgainstImages();
                }};
}

MenuCommand DiskCommands::showInFiles()
{
    return {.objectName = "showInFiles",
            .title = "S&how in Files",
            .shortcut = {},
            .perform = [this] { files_.show(placeOfSelection()); },
            .reasonAgainst =
                [this] {
                    return placeOfSelection().empty()
                               ? text("Select one image file, or one volume that is mounted.")
                               : "";
                }};
}

MenuCommand DiskCommands::copyReport()
{
    return {.objectName = "copyReport",
            .title = "C&opy Report",
            .shortcut = QKeySequence(Qt::CTRL | Qt::SHIFT | Qt::Key_C),
            .perform = [this] { QApplication::clipboard()->setText(toQt(report())); },
            .reasonAgainst =
                [this] {
                    return disks_.selected().empty() || at_.tabs.interface() == nullptr
                               ? text("Select a disk first.")
                               : "";
                }};
}

MenuCommand DiskCommands::properties()
{
    return {.objectName = "properties",
            .title = "Propert&ies…",
            .shortcut = QKeySequence(Qt::ALT | Qt::Key_Return),
            .perform = [this] { showProperties(); },
            .reasonAgainst =
                [this] {
                    return disks_.selected().size() == 1 ? "" : text("Select a single disk.");
                }};
}

std::string DiskCommands::reasonAgainstAll() const
{
    return isLocked() ? text("Not available while a job runs.") : std::string();
}

std::string DiskCommands::reasonAgainstButton(std::string_view button)
{
    const QtButton* const control = at_.tabs.button(button);
    if (control == nullptr)
        return text("Not available for this disk.");
    if (isLocked())
        return text("Not available while a job runs.");
    if (control->isEnabled())
        return {};
    // The library's reason says more than the module's.
    if (const auto disks = disks_.selected(); disks.size() == 1)
        if (std::string why = whyUnavailable(*disks.front(), library_, at_.host.translator());
            !why.empty())
            return why;
    return control->reason().empty() ? text("Not available for this disk.") : control->reason();
}

std::string DiskCommands::reasonAgainstImages() const
{
    const std::string reason = reasonAgainstAll();
    if (!reason.empty() || !disks_.selectedImages().empty())
        return reason;
    return text("Select a disk image first.");
}

// An image, also where a volume in it is selected, and otherwise what the volume is mounted at.
std::filesystem::path DiskCommands::placeOfSelection() const
{
    const auto disks = disks_.selected();
    if (disks.size() != 1)
        return {};
    const DiskFacts& facts = disks.front()->facts();
    return ImageOpener::canClose(*disks.front()) ? facts.path
                                                 : std::filesystem::path(facts.mountPoint);
}

// What was done to an image file is kept with what is in it, but for attempts that did not get
// there.
std::vector<NamedCheck> DiskCommands::runsOf(const std::shared_ptr<Disk>& disk)
{
    std::vector<NamedCheck> all;
    const auto add = [&](const Disk& one, const std::string& name) {
        for (const Run& run : at_.host.historyStore().runs(at_.host.histories().keyOf(one.facts())))
            all.push_back({name, checkOf(run)});
    };
    const auto& whole = disk->contents() ? disk->contents() : disk;
    add(*disk, "");
    for (const auto& part : withParts(whole))
        if (part != disk)
            add(*part, part == whole ? "" : part->displayName());
    std::ranges::stable_sort(all, std::ranges::greater(),
                             [](const NamedCheck& run) { return run.check.started; });
    all.resize(std::min(all.size(), mostRunsShown));
    return all;
}

void DiskCommands::showProperties()
{
    const auto rows = disks_.list().selectedRows();
    if (rows.size() != 1)
        return;
    desktop::showProperties(
        at_.window,
        {namesOf(rows.front()).name, diskIcon(rows.front().facts),
         propertiesOf(rows.front(), runsOf(disks_.selected().front()), at_.host.translator())},
        at_.host.translator());
}

// What the log shows of the disks, below what they are.
std::string DiskCommands::report()
{
    if (at_.host.histories().loadAll())
        at_.tabs.reloadLog();
    at_.tabs.interface()->outlinePeer()->flush();
    std::string report;
    for (const DiskRow& row : disks_.list().selectedRows())
        report += fromQt(rowSummary(row, at_.host.translator())) + "\n" +
                  contract::printable(row.facts.path.native()) + "\n\n";
    const QAbstractItemModel& log = *at_.tabs.interface()->outlinePeer()->table().model();
    for (int row = 0; row < log.rowCount(); ++row)
        report += fromQt(log.index(row, 0).data().toString()) + "\n";
    return report;
}

std::string DiskCommands::reasonAgainstMap()
{
    const std::string reason = reasonAgainstAll();
    if (!reason.empty() || diskWithMap() != nullptr)
        return reason;
    return text(disks_.selected().size() == 1 ? "It has no partition map that can be checked."
                                              : "Select a single disk.");
}

// The whole disk that is selected, or that is in the selected image, where a map can be treated.
std::shared_ptr<Disk> DiskCommands::diskWithMap()
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
void DiskCommands::treatMap(std::string_view button)
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
