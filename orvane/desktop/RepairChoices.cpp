// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/RepairChoices.h"

#include "contract/pellar/ErrorCodes.h"
#include "contract/toolkit/ControlNames.h"

#include <algorithm>
#include <array>
#include <utility>

namespace orvane::desktop {
namespace {

constexpr std::array errorsWithAChoice{contract::kPLErrorNotProven, contract::kPLErrorNotTried,
                                       contract::kPLErrorInterrupted};

constexpr pellar::Task repairOfVolume{pellar::Subject::Filesystem, pellar::Operation::Repair};

}  // namespace

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
    at_.tabs.button(contract::outlet::repairDisk)->press();
    if (!at_.controller.interfaceLock())
        policy_ = {};
}

void RepairChoices::lockChanged(bool isLocked)
{
    if (isLocked)
        runsInJob_ = 0;
    else
        policy_ = {};
}

void RepairChoices::runEnded(const StartedRun& run, const RunEnd& end)
{
    ++runsInJob_;
    auto disk = at_.host.sharedDiskController().diskNamed(run.identifier);
    const bool hasChoice = run.task == repairOfVolume && !policy_.isPreview && disk &&
                           std::ranges::count(errorsWithAChoice, end.errorCode) != 0;
    if (hasChoice)
        offers_.push_back({std::move(disk), end.errorCode, end.message});
}

void RepairChoices::offer()
{
    if (closer_.isEnding())
        offers_.clear();
    if (offers_.empty() || at_.controller.interfaceLock())
        return;
    const Offer first = std::move(offers_.front());
    offers_.pop_front();
    const QMessageBox* const box = ask(at_.window, questionAbout(first));
    QObject::connect(
        box, &QDialog::finished, &at_.window, [this] { offer(); }, Qt::QueuedConnection);
}

Question RepairChoices::questionAbout(const Offer& offer)
{
    const auto disk = offer.disk;
    if (offer.error == contract::kPLErrorNotProven)
        return {"unprovenQuestion",
                sentence("A repair was tried, and may leave damage. “%@” is as it was.", *disk),
                offer.message,
                {{text("Apply Anyway…"),
                  [this, offer] {
                      confirmUnproven(offer);
                  }}},
                text("Close")};
    if (offer.error == contract::kPLErrorNotTried)
        return {
            "untriedQuestion",
            sentence("The repair of “%@” could not be tried first, so nothing was written.", *disk),
            offer.message,
            {{text("Repair Directly…"),
              [this, offer] {
                  confirmDirect(offer);
              }}},
            text("Close")};
    return {
        "interruptedQuestion",
        sentence("A repair of “%@” was interrupted, and only a part of it is written.", *disk),
        text("Finishing it writes the rest. Undoing it puts back what it has overwritten. Until "
             "then, the disk is neither as before nor repaired; do not use it."),
        {{text("Finish Repair…"),
          [this, disk] {
              undo(*disk, pellar::Operation::Finish);
          }},
         {text("Undo Repair…"),
          [this, disk] {
              undo(*disk, pellar::Operation::Undo);
          }}},
        text("Close")};
}

void RepairChoices::confirmUnproven(const Offer& offer)
{
    ask(at_.window,
        {"unprovenConfirmation",
         sentence("Apply the repair of “%@”, although it may leave damage?", *offer.disk),
         text(
             "The volume may stay damaged, and the repair may remove files, or parts of them, that "
             "could still be read before. What it overwrites is kept, so it can be undone."),
         {{text("Apply Repair"),
           [this, disk = offer.disk] {
               repair(*disk, &pellar::RepairPolicy::appliesUnproven);
           }}},
         text("Cancel")});
}

void RepairChoices::confirmDirect(const Offer& offer)
{
    ask(at_.window,
        {"directConfirmation",
         sentence("Repair “%@” directly?", *offer.disk),
         text("The checking tool then writes to the disk itself. That cannot be undone: what it "
              "removes is gone, also where the repair fails or is stopped. Copy what matters to "
              "another disk first."),
         {{text("Repair Directly"),
           [this, disk = offer.disk] {
               repair(*disk, &pellar::RepairPolicy::isDirect);
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
        at_.host.showSheet("", {sentence("“%@” cannot be repaired now.", disk)});
}

void RepairChoices::undo(const Disk& disk, pellar::Operation operation)
{
    if (disks_.selectOnly(disk))
        undoing_.ask(operation);
    else
        at_.host.showSheet("", {sentence("“%@” is not in the list any more.", disk)});
}

}  // namespace orvane::desktop
