// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/ModuleHints.h"

#include "contract/toolkit/ControlNames.h"
#include "orvane/desktop/toolkit/Text.h"
#include "orvane/jobs/UnavailableReason.h"

#include <algorithm>
#include <iterator>
#include <utility>

namespace orvane::desktop {

namespace outlet = contract::outlet;

namespace {

bool isForPermissions(std::string_view button)
{
    return button == outlet::verifyPermissions || button == outlet::repairPermissions;
}

}  // namespace

// The reasons are posted, because the module says its own first; and told once for all that
// happens in one turn.
void ModuleHints::refresh()
{
    tellEmptyText();
    if (std::exchange(isAwaited_, true))
        return;
    at_.host.mainRunLoop().post([this] {
        isAwaited_ = false;
        tellReasons();
        tellEmptyText();
    });
}

void ModuleHints::tellEmptyText()
{
    LoadedInterface* const controls = at_.tabs.interface();
    if (controls != nullptr && controls->emptyNote() != nullptr)
        controls->emptyNote()->tell(toQt(emptyText()));
}

void ModuleHints::tellReasons()
{
    if (!at_.window.hasAttention() || at_.tabs.active() == nullptr)
        return;
    const auto disks = at_.window.disks().selectedDisks();
    const bool isLocked = at_.controller.interfaceLock();
    const auto reasons = !isLocked && disks.size() > 1 ? reasonsByDisk() : ReasonsByButton();
    for (const std::string_view name : outlet::actions)
        if (QtButton* const button = at_.tabs.button(name)) {
            if (isLocked)
                button->setHostReason(text("Not available while a job runs."));
            else if (disks.empty())
                button->setHostReason(text("Select a disk first."));
            else if (disks.size() == 1)
                button->setHostReason(reasonFor(*disks.front(), name));
            else if (const auto found = reasons.find(name); found != reasons.end())
                button->setHostReason(found->second);
        }
    if (QtButton* const clear = at_.tabs.button(outlet::clearHistory))
        clear->setHostReason(
            text(isLocked ? "Not available while a job runs." : "There is no history to clear."));
}

// Why the button is grey for the disk that is selected, where the module gives no reason.
std::string ModuleHints::reasonFor(const Disk& disk, std::string_view button)
{
    QtButton* const control = at_.tabs.button(button);
    if (control == nullptr || !control->reason().empty())
        return {};
    std::string reason = whyUnavailable(disk, library_, at_.host.translator());
    if (reason.empty() && disk.facts().type == diskType::whole && isForPermissions(button))
        reason = text("Not available because a whole disk has no permissions; its volumes have.");
    else if (reason.empty() && disk.facts().type == diskType::whole)
        reason = library_.reasonAgainstPartitionMap(*disk.theKRDisk());
    return reason.empty() ? text("Not available for this disk.") : reason;
}

// For several disks a module says that it is because of one of them. Each is asked about alone.
ModuleHints::ReasonsByButton ModuleHints::reasonsByDisk()
{
    constexpr std::size_t mostAsked = 32;
    ReasonsByButton reasons;
    const auto isGrey = [this](std::string_view name) {
        QtButton* const button = at_.tabs.button(name);
        return button != nullptr && !button->isEnabled();
    };
    std::vector<std::string_view> grey;
    std::copy_if(outlet::actions.begin(), outlet::actions.end(), std::back_inserter(grey), isGrey);
    const auto disks = at_.window.disks().selectedDisks();
    if (grey.empty() || disks.size() > mostAsked)
        return reasons;
    for (const auto& disk : disks) {
        at_.controller.setSelection({disk});
        at_.tabs.active()->tellOfSelection();
        for (const std::string_view name : grey) {
            if (!isGrey(name))
                continue;
            const std::string& own = at_.tabs.button(name)->reason();
            const std::string why = own.empty() ? reasonFor(*disk, name) : own;
            reasons[name] += (reasons[name].empty() ? "" : "\n") +
                             at_.host.translator().sentence("“%@”: %@", {disk->displayName(), why});
        }
    }
    at_.controller.setSelection({});
    at_.tabs.active()->tellOfSelection();
    return reasons;
}

// Nothing where the module's own words fit: when no disk is selected.
std::string ModuleHints::emptyText()
{
    const auto disks = at_.window.disks().selectedDisks();
    if (at_.controller.interfaceLock())
        return text("A job runs. There is no history of what is selected.");
    if (disks.empty())
        return {};
    if (disks.size() == 1)
        if (const std::string why = whyUnavailable(*disks.front(), library_, at_.host.translator());
            !why.empty())
            return why;
    const QtButton* const verify = at_.tabs.button(outlet::verifyDisk);
    if (verify == nullptr || !verify->isEnabled())
        return text("There is no history of what is selected.");
    return at_.host.translator().sentence(
        "There is no history of what is selected. Click %@ to check it.", {verify->title()});
}

}  // namespace orvane::desktop
