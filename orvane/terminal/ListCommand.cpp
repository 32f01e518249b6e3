// SPDX-License-Identifier: Apache-2.0
#include "orvane/jobs/JobLedger.h"
#include "orvane/support/disks/DiskFacts.h"
#include "orvane/support/disks/FormatName.h"
#include "orvane/support/texts/Quantities.h"
#include "orvane/terminal/Commands.h"
#include "orvane/terminal/TerminalText.h"

namespace orvane {
namespace {

std::string_view kindText(std::int32_t type)
{
    switch (type) {
        case diskType::whole: return "disk";
        case diskType::container: return "container";
        case diskType::volume: return "volume";
        case diskType::diskImage: return "disk image";
        case diskType::bareVolume: return "volume";
        case diskType::assembled: return "assembled volume";
        case diskType::opticalDisc: return "optical disc";
        default: return "disk";
    }
}

std::vector<ActionLine> actionsFor(const std::shared_ptr<Disk>& disk, Session& session)
{
    session.select({disk});
    std::vector<ActionLine> lines;
    for (const ActionButton& action : actionButtons) {
        const TerminalButton& button = session.button(action.outlet);
        lines.push_back({std::string(nameOf(action.command)), button.title(), button.isEnabled(),
                         button.isEnabled() ? "" : unavailableReason(session, button, *disk)});
    }
    return lines;
}

DiskLine describe(const std::shared_ptr<Disk>& disk, Session& session)
{
    const DiskFacts& facts = disk->facts();
    DiskLine line;
    const pellar::ListedRecord* const record = session.repairRecords().newestOf(facts);
    if (record != nullptr && record->isInterrupted()) {
        line.interruptedRepair = record->id;
        line.isOthersToUndo = !session.repairRecords().isUsers(*record);
    }
    line.disk = session.names().nameOf(facts.identifier);
    line.name = disk->displayName();
    line.kind = session.texts().text(kindText(facts.type));
    line.filesystem = facts.filesystem;
    line.format = formatName(facts.filesystem, facts.filesystemVersion);
    line.bytes = facts.length;
    line.mountPoint = facts.mountPoint;
    if (const auto next = nextCheckOf(*disk, session.checkTimers()))
        line.nextCheck = localTime(*next);
    const std::string key = session.host().histories().keyOf(facts);
    const auto runs = lastRunsOf(session.host().historyStore(), key,
                                 publishedRun(session.publishedChecks(), key));
    if (!runs)
        return line;
    line.lastChecked = localTime(runs->told.started);
    line.verdict = runs->told.verdict();
    if (const auto& later = runs->later)
        line.later = {localTime(later->started), later->verdict()};
    return line;
}

void listTree(const std::shared_ptr<Disk>& disk, bool isVolume, Session& session,
              Reporter& reporter)
{
    DiskLine line = describe(disk, session);
    line.isVolume = isVolume;
    line.actions = actionsFor(disk, session);
    reporter.listed(line);
    for (const std::shared_ptr<Disk>& part : disk->parts())
        if (part->facts().isShown)
            listTree(part, true, session, reporter);
}

/// What an image holds is shown below it; commands take the image, and treat every volume of it.
void listImage(const NamedDisk& image, Session& session, Reporter& reporter)
{
    const AttachedImage attached(session, image.disk);
    const std::shared_ptr<Disk>& top = attached.top();
    DiskLine line = describe(image.disk, session);
    line.actions = actionsFor(image.disk, session);
    if (top && top->parts().empty()) {
        const DiskLine volume = describe(top, session);
        line.filesystem = volume.filesystem;
        line.format = volume.format;
        line.name = volume.name;
        line.lastChecked = volume.lastChecked;
        line.verdict = volume.verdict;
        line.later = volume.later;
        line.interruptedRepair = volume.interruptedRepair;
        line.isOthersToUndo = volume.isOthersToUndo;
    }
    reporter.listed(line);
    if (!top)
        return;
    for (const std::shared_ptr<Disk>& part : top->parts()) {
        if (!part->facts().isShown)
            continue;
        DiskLine volume = describe(part, session);
        volume.isVolume = true;
        reporter.listed(volume);
    }
    if (top->facts().hasDamagedMap)
        reporter.warning(damagedMapSentence(session, image));
}

}  // namespace

int runList(const Request& request, Session& session, Reporter& reporter)
{
    int status = 0;
    if (request.disks.empty()) {
        session.host().refreshDisks();
        for (const std::shared_ptr<Disk>& disk : session.host().sharedDiskController().roots())
            listTree(disk, false, session, reporter);
        return status;
    }
    for (const NamedDisk& named : session.findDisks(request.disks, status)) {
        if (named.disk->isOfflineDiskImage())
            listImage(named, session, reporter);
        else
            listTree(named.disk, named.disk->parentDisk() != nullptr, session, reporter);
    }
    return status;
}

}  // namespace orvane
