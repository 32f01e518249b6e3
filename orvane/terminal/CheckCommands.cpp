// SPDX-License-Identifier: Apache-2.0
#include "contract/pellar/ErrorCodes.h"
#include "orvane/jobs/JobLedger.h"
#include "orvane/jobs/UnavailableReason.h"
#include "orvane/terminal/Commands.h"

#include <sys/stat.h>

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
        reporter.failure(
            named.name,
            contract::format("%@: %@: %@", {named.name, button.title(),
                                            unavailableReason(session, button, *named.disk)}));
        status |= exitUnchecked;
    }
    return usable;
}

/// The verdicts of the disk and of what lies inside it; for a disk that no job reached, why.
int settle(const NamedDisk& named, const ActionButton& action, Session& session, Reporter& reporter)
{
    int status = 0;
    bool wasReached = false;
    for (const auto& [identifier, outcome] : session.outcomes()) {
        if (!GivenNames::isWithin(identifier, named.disk->facts().identifier))
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
        why = session.texts().sentence(
            "“%@” was not checked: the question was not answered with yes", {named.name});
    else if (named.disk->isOfflineDiskImage())
        keepUnreached(session.host(), *named.disk,
                      action.command == Command::Repair ? pellar::Operation::Repair
                                                        : pellar::Operation::Verify,
                      why);
    reporter.failure(named.name, why);
    return exitUnchecked;
}

/// The disk, or something inside it, was of a kind that can be checked.
bool wasUnderstood(const NamedDisk& named, Session& session)
{
    const auto& outcomes = session.outcomes();
    return std::any_of(outcomes.begin(), outcomes.end(), [&named](const auto& outcome) {
        return GivenNames::isWithin(outcome.first, named.disk->facts().identifier) &&
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
             session.library().reasonAgainstPartitionMap(*named.disk->theKRDisk()).empty())
        reporter.warning(session.texts().sentence(
            "“%@” has a partition map; --partition-map checks it", {named.name}));
}

int treat(const std::vector<NamedDisk>& wanted, const ActionButton& action, Session& session,
          Reporter& reporter)
{
    int status = 0;
    const std::vector<NamedDisk> disks = usableDisks(wanted, action, session, reporter, status);
    if (disks.empty())
        return status;
    std::vector<std::shared_ptr<Disk>> selection;
    for (const NamedDisk& named : disks)
        selection.push_back(named.disk);
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

/// Why the partition map of the disk that was named cannot be treated; empty when it can.
std::string objectionToMap(const NamedDisk& named, const std::shared_ptr<Disk>& whole,
                           Session& session)
{
    if (!whole)
        return session.host().imageAttachment().lastError(named.disk->diskImagePath());
    std::string why;
    if (whole->parentDisk() != nullptr)
        why = session.texts().text("it is a part of a disk, not a whole one");
    else
        why = session.library().reasonAgainstPartitionMap(*whole->theKRDisk());
    // What fills a disk and looks like a map besides (an optical image) is listed as one volume.
    if (why.empty() && !whole->isWhole())
        why = session.texts().text("it is one volume, not a disk with partitions");
    return why.empty() ? why
                       : session.texts().sentence("cannot check the partition map of “%@”: %@",
                                                  {named.name, why});
}

/// Treats the disks' partition maps; images stay attached until the end. A disk without one is
/// reported and left out.
int treatMaps(const std::vector<NamedDisk>& wanted, const ActionButton& action, Session& session,
              Reporter& reporter)
{
    int status = 0;
    std::vector<AttachedImage> images;
    std::vector<NamedDisk> disks;
    for (const NamedDisk& named : wanted) {
        const AttachedImage& image = images.emplace_back(session, named.disk);
        const auto whole = named.disk->isOfflineDiskImage() ? image.top() : named.disk;
        const std::string objection = objectionToMap(named, whole, session);
        if (objection.empty()) {
            disks.push_back({named.name, whole});
            continue;
        }
        reporter.failure(named.name, objection);
        status |= exitUnchecked;
    }
    return status | treat(disks, action, session, reporter);
}

/// Why the repaired volume cannot be kept as asked; empty when it can. A volume is looked for in
/// an image, which is attached for that.
std::string objectionToKeeping(const std::filesystem::path& file, const NamedDisk& named,
                               Session& session)
{
    struct stat status = {};
    if (::lstat(file.c_str(), &status) == 0)
        return session.texts().sentence("“%@” is there already, and is not overwritten",
                                        {file.native()});
    const AttachedImage image(session, named.disk);
    const auto& disk = image.top() ? image.top() : named.disk;
    return disk->parts().size() > 1
               ? session.texts().sentence("“%@” holds several volumes, and --keep takes one",
                                          {named.name})
               : std::string();
}

}  // namespace

std::string unavailableReason(Session& session, const TerminalButton& button, const Disk& disk)
{
    if (!disk.hasSMARTError() && !button.reason().empty())
        return button.reason();
    const std::string reason = whyUnavailable(disk, session.library(), session.texts());
    return reason.empty() ? session.texts().text("Not available for this disk.") : reason;
}

std::string damagedMapSentence(Session& session, const NamedDisk& image)
{
    return session.texts().sentence(
        "the partition map of “%@” is damaged; --partition-map checks and repairs it",
        {image.name});
}

int runCheck(const Request& request, Session& session, Reporter& reporter)
{
    int status = 0;
    const ActionButton& action = *std::find_if(
        actionButtons.begin(), actionButtons.end(),
        [&](const ActionButton& button) { return button.command == request.command; });
    const std::vector<NamedDisk> named = session.findDisks(request.disks, status);
    const auto& kept = request.repairPolicy.keptImage;
    if (!kept.empty() && !named.empty())
        if (const std::string objection = objectionToKeeping(kept, named.front(), session);
            !objection.empty()) {
            reporter.failure(named.front().name, objection);
            return exitUnchecked;
        }
    return status | (request.treatsPartitionMap ? treatMaps(named, action, session, reporter)
                                                : treat(named, action, session, reporter));
}

}  // namespace orvane
