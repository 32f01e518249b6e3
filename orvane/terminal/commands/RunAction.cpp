// SPDX-License-Identifier: Apache-2.0
#include "contract/pellar/ErrorCodes.h"
#include "orvane/jobs/UnreachedImage.h"
#include "orvane/terminal/ExitStatus.h"
#include "orvane/terminal/commands/ActionButtons.h"
#include "orvane/terminal/commands/Commands.h"
#include "orvane/terminal/commands/WholeDisks.h"

#include <algorithm>

namespace orvane {
namespace {

/// A button that is off for several disks may be so because of one of them, so each is asked
/// alone: one bad disk does not keep the others from being checked.
std::vector<NamedDisk> usableDisks(const std::vector<NamedDisk>& disks, const ActionButton& action,
                                   Session& session, Reporter& reporter, int& status)
{
    std::vector<NamedDisk> usable;
    for (const NamedDisk& named : disks) {
        session.select({named.disk});
        const TerminalButton& button = session.button(action.outlet);
        if (button.isEnabled()) {
            usable.push_back(named);
            continue;
        }
        reporter.failure(named.name, unavailableSentence(session, button, named));
        status |= exitUnchecked;
    }
    return usable;
}

std::vector<std::shared_ptr<Disk>> selectionOf(const std::vector<NamedDisk>& disks)
{
    std::vector<std::shared_ptr<Disk>> selection;
    for (const NamedDisk& named : disks)
        selection.push_back(named.disk);
    return selection;
}

/// The verdicts of the disk and of what lies inside it; for a disk that no job reached, why.
int settle(const NamedDisk& named, const ActionButton& action, Session& session, Reporter& reporter)
{
    int status = 0;
    bool wasReached = false;
    for (const auto& [identifier, outcome] : session.jobs().outcomes()) {
        if (!DiskNames::isWithin(identifier, named.disk->facts().identifier))
            continue;
        status |= exitStatusFor(outcome.verdict);
        wasReached = true;
    }
    if (session.wasStopped())
        return status | exitStopped;
    if (wasReached)
        return status;
    std::string why = whyUnreached(session.host(), *named.disk, named.name);
    if (session.wasDeclined())
        why = session.host().translator().sentence(
            "“%@” was not checked: the question was not answered with yes", {named.name});
    else if (named.disk->isOfflineDiskImage())
        keepUnreached(
            session.host(), *named.disk,
            action.command == Command::Repair ? Operation::RepairDisk : Operation::VerifyDisk, why);
    reporter.failure(named.name, why);
    return exitUnchecked;
}

/// The disk, or something inside it, was of a kind that can be checked.
bool wasUnderstood(const NamedDisk& named, Session& session)
{
    const auto& outcomes = session.jobs().outcomes();
    return std::any_of(outcomes.begin(), outcomes.end(), [&named](const auto& outcome) {
        return DiskNames::isWithin(outcome.first, named.disk->facts().identifier) &&
               outcome.second.errorCode != contract::kPLErrorUnsupported;
    });
}

/// Where nothing in an image could be checked, its partition map still can; and a damaged one must
/// be, whatever its volumes are.
void pointToMap(const NamedDisk& named, Session& session, Reporter& reporter)
{
    const bool wasTried = !session.wasStopped() && !session.wasDeclined();
    const auto& contents = named.disk->contents();
    if (wasTried && contents && contents->facts().hasDamagedMap)
        reporter.warning(damagedMapSentence(session, named));
    else if (wasTried && named.disk->isOfflineDiskImage() && !wasUnderstood(named, session) &&
             session.reasonAgainstPartitionMap(named.disk).empty())
        reporter.warning(session.host().translator().sentence(
            "“%@” has a partition map; --partition-map checks it", {named.name}));
}

int treat(const std::vector<NamedDisk>& wanted, const ActionButton& action, Session& session,
          Reporter& reporter)
{
    int status = 0;
    const std::vector<NamedDisk> disks = usableDisks(wanted, action, session, reporter, status);
    if (disks.empty())
        return status;
    const auto selection = selectionOf(disks);
    session.select(selection);
    session.host().sharedDiskController().hold(selection);
    session.pressAndWait(session.button(action.outlet));
    session.host().sharedDiskController().release();
    for (const NamedDisk& named : disks) {
        status |= settle(named, action, session, reporter);
        pointToMap(named, session, reporter);
    }
    return status;
}

}  // namespace

int runAction(const Request& request, Session& session, Reporter& reporter)
{
    int status = 0;
    const ActionButton& action = actionButtonFor(request.command);
    const std::vector<NamedDisk> named = findDisks(request.disks, session, reporter, status);
    if (!request.treatsPartitionMap)
        return status | treat(named, action, session, reporter);
    const WholeDisks whole(named, session, reporter, status);
    return status | treat(whole.disks(), action, session, reporter);
}

std::vector<NamedDisk> findDisks(const std::vector<std::string>& names, Session& session,
                                 Reporter& reporter, int& status,
                                 std::string (*meant)(const std::string& name))
{
    std::vector<NamedDisk> disks;
    for (const std::string& name : names) {
        auto found = session.findDisk(meant != nullptr ? meant(name) : name);
        if (!found) {
            reporter.failure(name, found.error().message);
            status |= exitUnchecked;
            continue;
        }
        disks.push_back({name, *std::move(found)});
    }
    return disks;
}

}  // namespace orvane
