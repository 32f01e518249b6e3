// SPDX-License-Identifier: Apache-2.0
// What the window says about disks beyond what the modules say: their states in the list, why a
// button is grey, and why a log is empty.

#include "orvane/desktop/DesktopSession.h"
#include "orvane/desktop/toolkit/Text.h"
#include "orvane/jobs/HostReasons.h"
#include "orvane/jobs/LastRuns.h"

#include <array>

namespace orvane::desktop {
namespace {

constexpr std::array actionButtons{"verifyDiskButton", "repairDiskButton",
                                   "verifyPermissionsButton", "repairPermissionsButton"};

Check checkOf(const Run& run)
{
    const auto started =
        std::chrono::duration_cast<std::chrono::milliseconds>(run.started.time_since_epoch());
    return {run.verdict(), run.end ? run.end->message : "",
            QDateTime::fromMSecsSinceEpoch(started.count())};
}

bool isForPermissions(std::string_view button)
{
    return button.find("Permissions") != std::string_view::npos;
}

}  // namespace

DiskStates DesktopSession::diskStates()
{
    return {[this](const Disk& disk) { return lastCheckOf(disk); },
            [this](const Disk& disk) { return activityOn(disk); },
            [this](const Disk& disk) {
                return images_.noteOn(disk);
            }};
}

std::optional<LastCheck> DesktopSession::lastCheckOf(const Disk& disk)
{
    auto runs = lastRunsOf(host_.historyStore(), host_.histories().keyOf(disk.facts()));
    // The run that is under way has no end yet, and is told as what it is.
    const bool isAtWork = !activityOn(disk).empty();
    if (runs && isAtWork && !runs->told.end)
        return std::nullopt;
    if (runs && isAtWork)
        runs->later.reset();
    if (!runs)
        return std::nullopt;
    LastCheck check{checkOf(runs->told), std::nullopt};
    if (runs->later)
        check.later = checkOf(*runs->later);
    return check;
}

std::string DesktopSession::activityOn(const Disk& disk)
{
    const StartedRun* const run = jobs_.currentRun();
    if (run == nullptr || run->identifier != disk.facts().identifier)
        return {};
    return text(writes(run->operation) ? "repairing…" : "verifying…");
}

// The reasons are posted, because the module says what it has to say in the meantime; and once for
// all that happens in one turn.
void DesktopSession::refreshHints()
{
    tellEmptyText();
    if (std::exchange(areHintsAwaited_, true))
        return;
    loop_.post([this] {
        areHintsAwaited_ = false;
        tellReasons();
        tellEmptyText();
    });
}

void DesktopSession::tellEmptyText()
{
    ModuleTab* const tab = activeTab();
    EmptyNote* const note =
        tab != nullptr && tab->interface() != nullptr ? tab->interface()->emptyNote() : nullptr;
    if (note != nullptr)
        note->tell(toQt(emptyText()));
}

void DesktopSession::tellReasons()
{
    if (!window_.hasAttention() || activeTab() == nullptr)
        return;
    const auto disks = window_.disks().selectedDisks();
    std::map<std::string, std::string> reasons;
    if (controller_.interfaceLock())
        for (const char* const name : actionButtons)
            reasons[name] = text("Not available while a job runs.");
    else if (disks.empty())
        for (const char* const name : actionButtons)
            reasons[name] = text("Select a disk first.");
    else if (disks.size() == 1)
        for (const char* const name : actionButtons)
            reasons[name] = reasonFor(*disks.front(), name);
    else
        reasons = reasonsByDisk();
    for (const auto& [name, reason] : reasons)
        if (QtButton* const button = moduleButton(name.c_str()))
            button->setHostReason(reason);
    if (QtButton* const clear = moduleButton("clearHistoryButton"))
        clear->setHostReason(text(controller_.interfaceLock() ? "Not available while a job runs."
                                                              : "There is no history to clear."));
}

// Why the button is grey for the disk that is selected, where the module gives no reason.
std::string DesktopSession::reasonFor(const Disk& disk, std::string_view button)
{
    QtButton* const control = moduleButton(std::string(button).c_str());
    if (control == nullptr || !control->reason().empty())
        return {};
    std::string reason = orvane::reasonOfHost(disk, library_, host_.translator());
    if (reason.empty() && disk.facts().type == diskType::whole && isForPermissions(button))
        reason = text("Not available because a whole disk has no permissions; its volumes have.");
    else if (reason.empty() && disk.facts().type == diskType::whole)
        reason = library_.reasonAgainstPartitionMap(*disk.theKRDisk());
    return reason.empty() ? text("Not available for this disk.") : reason;
}

// For several disks a module says that it is because of one of them. Each is asked about alone.
std::map<std::string, std::string> DesktopSession::reasonsByDisk()
{
    constexpr std::size_t mostAsked = 32;
    std::map<std::string, std::string> reasons;
    const auto isGrey = [this](const char* name) {
        QtButton* const button = moduleButton(name);
        return button != nullptr && !button->isEnabled();
    };
    std::vector<const char*> grey;
    std::copy_if(actionButtons.begin(), actionButtons.end(), std::back_inserter(grey), isGrey);
    const auto disks = window_.disks().selectedDisks();
    if (grey.empty() || disks.size() > mostAsked)
        return reasons;
    for (const auto& disk : disks) {
        controller_.setSelection({disk});
        activeTab()->tellOfSelection();
        for (const char* const name : grey) {
            if (!isGrey(name))
                continue;
            const std::string& own = moduleButton(name)->reason();
            const std::string why = own.empty() ? reasonFor(*disk, name) : own;
            reasons[name] += (reasons[name].empty() ? "" : "\n") +
                             host_.translator().sentence("“%@”: %@", {disk->displayName(), why});
        }
    }
    controller_.setSelection({});
    activeTab()->tellOfSelection();
    return reasons;
}

// Nothing where the module's own words fit: when no disk is selected.
std::string DesktopSession::emptyText()
{
    const auto disks = window_.disks().selectedDisks();
    if (controller_.interfaceLock())
        return text("A job runs. There is no history of what is selected.");
    if (disks.empty())
        return {};
    if (disks.size() == 1)
        if (const std::string why =
                orvane::reasonOfHost(*disks.front(), library_, host_.translator());
            !why.empty())
            return why;
    const QtButton* const verify = moduleButton("verifyDiskButton");
    if (verify == nullptr || !verify->isEnabled())
        return text("There is no history of what is selected.");
    return host_.translator().sentence(
        "There is no history of what is selected. Click %@ to check it.", {verify->title()});
}

}  // namespace orvane::desktop
