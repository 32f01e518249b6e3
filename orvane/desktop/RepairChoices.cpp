// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/RepairChoices.h"

#include "contract/pellar/ErrorCodes.h"
#include "contract/toolkit/ControlNames.h"
#include "orvane/desktop/toolkit/Text.h"
#include "orvane/support/settings/Switch.h"

#include <QCheckBox>

#include <algorithm>
#include <utility>

namespace orvane::desktop {

namespace selector = contract::selector;

bool RepairChoices::mayPerform(std::string_view action)
{
    const bool isRepair = action == selector::repairDisk || action == selector::repairPermissions;
    if (!isRepair || isConfirmed_ || !asksBeforeRepair.isOn(at_.host.standardUserDefaults()))
        return true;
    askBeforeRepair(action);
    return false;
}

void RepairChoices::press(std::string_view button)
{
    isConfirmed_ = true;
    if (QtButton* const control = at_.tabs.button(button))
        control->press();
    isConfirmed_ = false;
}

std::string RepairChoices::nameOfSelection()
{
    const auto disks = at_.controller.allSelectedItemsFilterDuplicates(false, true);
    if (disks.size() == 1)
        return at_.host.translator().sentence("“%@”", {disks.front()->displayName()});
    const auto count = static_cast<long>(disks.size());
    return contract::format(at_.host.translator().plural("%ld disk", "%ld disks", count), {count});
}

bool RepairChoices::isUnreadable()
{
    const auto rows = disks_.list().selectedRows();
    return std::ranges::any_of(rows, [](const DiskRow& row) {
        if (!row.lastCheck)
            return row.facts.hasSMARTError;
        const LastCheck& check = *row.lastCheck;
        return row.facts.hasSMARTError ||
               (check.later ? *check.later : check.told).errorCode == contract::kPLErrorUnreadable;
    });
}

std::string RepairChoices::meaningOfRepair(std::string_view action)
{
    if (action == selector::repairPermissions)
        return text(
            "The permissions, owners and groups of the files of installed packages are set "
            "to what the packages say. What they were is kept, so it can be undone.");
    if (!kept_.canTry())
        return text(
            "The checking tool writes to the disk itself, because there is no place here "
            "to try the repair first. That cannot be undone. Copy what matters first.");
    return text(
        "The repair is tried first, and the result is checked. Only where no damage would "
        "be left, the disk is written to. What is overwritten is kept, so the repair can "
        "be undone with “Undo Repair” in the Disk menu.");
}

// A disk that cannot be read loses by every attempt: for it, no repair is offered.
void RepairChoices::askBeforeRepair(std::string_view action)
{
    const bool isOfDisk = action == selector::repairDisk;
    if (isOfDisk && isUnreadable()) {
        explainCopying_();
        return;
    }
    const std::string_view button =
        isOfDisk ? contract::outlet::repairDisk : contract::outlet::repairPermissions;
    std::vector<Question::Answer> answers{{text("Repair"), [this, button] {
                                               press(button);
                                           }}};
    if (isOfDisk && reasonAgainstPreview().empty())
        answers.push_back({text("Preview"), [this] {
                               preview();
                           }});
    QMessageBox* const box =
        ask(at_.window,
            {isOfDisk ? "repairQuestion" : "permissionsQuestion",
             sentence(isOfDisk ? "Repair %@?" : "Repair the permissions of %@?", nameOfSelection()),
             meaningOfRepair(action), std::move(answers), text("Cancel")});
    auto* const again = new QCheckBox(toQtTitle(text("Ask before every repair")));
    again->setChecked(true);
    box->setCheckBox(again);
    QObject::connect(again, &QCheckBox::toggled, &at_.window, [this](bool isOn) {
        asksBeforeRepair.set(at_.host.standardUserDefaults(), isOn);
    });
}

std::string RepairChoices::reasonAgainstPreview()
{
    if (at_.controller.interfaceLock())
        return text("Not available while a job runs.");
    if (disks_.selected().empty())
        return text("Select a disk first.");
    if (!kept_.canTry())
        return text("There is no place to keep what a repair would write.");
    const QtButton* const button = at_.tabs.button(contract::outlet::repairDisk);
    if (button != nullptr && button->isEnabled())
        return {};
    return button != nullptr && !button->reason().empty() ? button->reason()
                                                          : text("Not available for this disk.");
}

// What is asked for is done as long as the window is locked: the module's own button means what it
// always meant.
void RepairChoices::begin(Way way)
{
    policy_ = {};
    policy_.*way = true;
    press(contract::outlet::repairDisk);
    if (!at_.controller.interfaceLock())
        policy_ = {};
}

void RepairChoices::lockChanged(bool isLocked)
{
    if (!isLocked)
        policy_ = {};
}

void RepairChoices::confirmUnproven()
{
    confirm("unprovenConfirmation", "Apply the repair of “%@”, although it may leave damage?",
            "The volume may stay damaged, and the repair may remove files, or parts of them, that "
            "could still be read before. What it overwrites is kept, so it can be undone.",
            "Apply Repair", &pellar::RepairPolicy::appliesUnproven);
}

void RepairChoices::confirmDirect()
{
    confirm("directConfirmation", "Repair “%@” directly?",
            "The checking tool then writes to the disk itself. That cannot be undone: what it "
            "removes is gone, also where the repair fails or is stopped. Copy what matters to "
            "another disk first.",
            "Repair Directly", &pellar::RepairPolicy::isDirect);
}

void RepairChoices::confirm(const char* objectName, std::string_view question,
                            std::string_view meaning, std::string_view answer, Way way)
{
    const auto disks = disks_.selected();
    if (disks.size() != 1)
        return;
    ask(at_.window, {objectName,
                     sentence(question, disks.front()->displayName()),
                     text(meaning),
                     {{text(answer),
                       [this, disk = disks.front(), way] {
                           repair(*disk, way);
                       }}},
                     text("Cancel")});
}

void RepairChoices::repair(const Disk& disk, Way way)
{
    const QtButton* const button = at_.tabs.button(contract::outlet::repairDisk);
    if (!at_.controller.interfaceLock() && disks_.selectOnly(disk) && button != nullptr &&
        button->isEnabled())
        begin(way);
    else
        at_.host.showSheet("", {sentence("“%@” cannot be repaired now.", disk.displayName())});
}

}  // namespace orvane::desktop
