// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/texts/Quantities.h"
#include "orvane/terminal/Commands.h"
#include "orvane/terminal/TerminalText.h"

#include <algorithm>

namespace orvane {
namespace {

std::vector<RunLine> runsOf(const std::vector<std::shared_ptr<Disk>>& disks, Session& session)
{
    struct Line {
        Run::Time time;
        Run run;
        std::string record;
    };
    std::vector<Line> lines;
    for (const std::shared_ptr<Disk>& disk : disks) {
        // Of one disk they stand in the order in which they were, though a clock was put back.
        Run::Time newest{};
        const std::vector<Run> runs =
            session.host().historyStore().runs(session.host().histories().keyOf(disk->facts()));
        const pellar::ListedRecord* const record = session.repairRecords().newestOf(disk->facts());
        const Run* const undoable = record != nullptr && session.repairRecords().isUsers(*record)
                                        ? runOf(record->facts.repair, runs)
                                        : nullptr;
        for (const Run& run : runs) {
            newest = std::max(newest, run.started);
            lines.push_back({newest, run, &run == undoable ? record->id : ""});
        }
    }
    std::ranges::stable_sort(lines, {}, &Line::time);
    std::vector<RunLine> told;
    for (const auto& [time, run, record] : lines)
        told.push_back({localTime(run.started), run.action, run.verdict(),
                        run.end ? run.end->message : "", record});
    return told;
}

// The module leaves out the disks of a failing drive, on which nothing is to be done. Their history
// is wanted most of all, and looking at it does nothing to them.
void forgetFailure(const std::shared_ptr<Disk>& disk)
{
    DiskFacts facts = disk->facts();
    facts.hasSMARTError = false;
    disk->setFacts(facts);
}

}  // namespace

int runHistory(const Request& request, Session& session, Reporter& reporter)
{
    int status = 0;
    for (const NamedDisk& named : session.findDisks(request.disks, status)) {
        const AttachedImage image(session, named.disk);
        std::vector<std::shared_ptr<Disk>> selection =
            withParts(image.top() ? image.top() : named.disk);
        // The records of the image as a file belong to its history, too.
        if (image.top())
            selection.push_back(named.disk);
        std::for_each(selection.begin(), selection.end(), forgetFailure);
        session.select({named.disk});
        if (request.clearsHistory) {
            // A volume's history is its own to clear, the whole disk's alone would leave it.
            session.select(selection);
            session.pressAndWait(session.button(contract::outlet::clearHistory));
        } else {
            reporter.runs(named.name, runsOf(selection, session));
            session.writeAllRowsOf(named.name);
        }
    }
    return status;
}

}  // namespace orvane
