// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/DiskPane.h"

#include "contract/foundation/UTF8.h"
#include "orvane/support/settings/XDGPaths.h"

#include <algorithm>
#include <array>
#include <iterator>
#include <system_error>
#include <utility>

namespace orvane::desktop {
namespace {

constexpr std::array<contract::Name const*, 4> diskNotifications{
    &contract::OVDiskAppearedNotification, &contract::OVDiskUnmountedNotification,
    &contract::OVDiskChangedNotification, &contract::OVDiskEjectedNotification};

std::vector<DiskTree> readDisks(DiskReader& reader)
{
    DiskSources sources;
    sources.homeDirectory = environmentValue("HOME").value_or("");
    return reader.read(sources);
}

std::string_view activityIn(pellar::Operation operation)
{
    switch (operation) {
        case pellar::Operation::Verify: return "verifying…";
        case pellar::Operation::Undo: return "undoing…";
        case pellar::Operation::Repair:
        case pellar::Operation::Finish: break;
    }
    return "repairing…";
}

}  // namespace

Check checkOf(const Run& run)
{
    const auto started =
        std::chrono::duration_cast<std::chrono::milliseconds>(run.started.time_since_epoch());
    const RunEnd end = run.end.value_or(RunEnd{});
    return {run.verdict(),    end.message,   QDateTime::fromMSecsSinceEpoch(started.count()),
            run.action,       end.errorCode, end.problems,
            end.problemKinds, end.hasLosses};
}

void DiskScan::start()
{
    if (std::exchange(isScanning_, true)) {
        mustScanAgain_ = true;
        return;
    }
    const auto scan = [&loop = loop_, &reader = reader_, scan = liveness_] {
        loop.post([scan, disks = readDisks(reader)] {
            if (*scan != nullptr)
                (*scan)->finish(disks);
        });
    };
    try {
        thread_ = std::jthread(scan);
    } catch (const std::system_error&) {
        finish(readDisks(reader_));
    }
}

void DiskScan::finish(const std::vector<DiskTree>& disks)
{
    isScanning_ = false;
    const bool mustScanAgain = std::exchange(mustScanAgain_, false);
    finished_(disks);
    if (mustScanAgain)
        start();
}

DiskPane::DiskPane(DesktopHost& host, EventLoop& loop, DiskList& list, const JobLedger& ledger,
                   const KeptRepairs& repairs, std::vector<std::string> named,
                   bool scansSystemDisks, Events events)
    : host_(host),
      list_(list),
      ledger_(ledger),
      repairs_(repairs),
      named_(std::move(named)),
      scansSystemDisks_(scansSystemDisks),
      events_(std::move(events)),
      scheduled_(loop, [this] { synchronize(); }),
      model_(host.sharedDiskController(), states(), host.translator()),
      recent_(host.standardUserDefaults()),
      images_(host, {[this](const Disk& disk) {
                         if (!isReopening_)
                             list_.select(disk);
                     },
                     [this](const std::string& image) {
                         if (!isReopening_)
                             recent_.add(image);
                     },
                     [this](const std::vector<std::string>& sentences) { tellFailures(sentences); },
                     [this] {
                         synchronize();
                     }}),
      scan_(loop, [this](const std::vector<DiskTree>& disks) { adoptDisks(disks); }),
      watch_(loop, [this] { scan_.start(); })
{
    list_.show(model_, [this] { events_.selectionChanged(); });
    for (const contract::Name* const name : diskNotifications)
        host_.defaultCenter().addObserver(this, *name,
                                          [this](const contract::Notification&) { synchronize(); });
}

DiskPane::~DiskPane()
{
    for (const contract::Name* const name : diskNotifications)
        host_.defaultCenter().removeObserver(this, *name);
}

void DiskPane::synchronize()
{
    list_.synchronize();
    // Before the start, what was open when the program ended is still wanted.
    if (hasStarted_)
        recent_.keepOpen(images_.openImages());
    events_.changed();
}

void DiskPane::tellFailures(const std::vector<std::string>& sentences)
{
    host_.showSheet(host_.translator().text("Not everything could be opened."), sentences);
}

// Watched before they are read, so that nothing is missed in between. Without the watch the
// command to rescan is still there, so no sheet says it.
void DiskPane::start()
{
    if (scansSystemDisks_) {
        if (const auto watching = watch_.start(); !watching)
            host_.log().ov_log(contract::OVLog::error, 0, watching.error().message);
        list_.setLooking(true);
        scan_.start();
        scheduled_.start();
    }
    isReopening_ = true;
    images_.open(recent_.toReopen());
    isReopening_ = false;
    hasStarted_ = true;
    recent_.keepOpen(images_.openImages());
    openNamed(true);
    if (!scansSystemDisks_)
        openNamed(false);
}

// A label means nothing before the disks have been read. Image files need not wait for that.
void DiskPane::adoptDisks(const std::vector<DiskTree>& disks)
{
    host_.sharedDiskController().synchronize(disks);
    list_.setLooking(false);
    if (!std::exchange(hasReadDisks_, true))
        openNamed(false);
}

void DiskPane::openNamed(bool areFiles)
{
    std::vector<std::string> names;
    std::copy_if(named_.begin(), named_.end(), std::back_inserter(names),
                 [=](const std::string& name) {
                     std::error_code ignored;
                     return std::filesystem::is_regular_file(name, ignored) == areFiles;
                 });
    images_.open(names);
}

void DiskPane::rescan()
{
    images_.refreshAll();
    scan_.start();
}

void DiskPane::refresh(const std::vector<std::shared_ptr<Disk>>& disks)
{
    for (const auto& disk : disks)
        images_.refresh(*disk);
}

bool DiskPane::selectOnly(const Disk& disk)
{
    const auto image = host_.sharedDiskController().find([&disk](const Disk& other) {
        return other.contents() && other.contents()->diskIdentifier() == disk.diskIdentifier();
    });
    const auto isSelected = [this](const Disk& wanted) {
        list_.select(wanted);
        const auto disks = selected();
        return disks.size() == 1 && disks.front()->diskIdentifier() == wanted.diskIdentifier();
    };
    return isSelected(disk) || (image && isSelected(*image));
}

void DiskPane::hold(const std::vector<contract::OVDiskPointer>& others)
{
    auto disks = selected();
    for (const auto& disk : others)
        if (auto other = std::dynamic_pointer_cast<Disk>(disk))
            disks.push_back(std::move(other));
    host_.sharedDiskController().hold(std::move(disks));
}

void DiskPane::release()
{
    if (host_.sharedDiskController().release()) {
        list_.synchronize();
        events_.selectionChanged();
    }
    const auto disks = selected();
    const bool mayHaveWritten = std::any_of(
        disks.begin(), disks.end(), [](const auto& disk) { return !ImageOpener::canClose(*disk); });
    // A label or a size may be another one, and no event need have told what a repair has written.
    if (mayHaveWritten && scansSystemDisks_)
        scan_.start();
}

DiskStates DiskPane::states()
{
    return {[this](const Disk& disk) { return lastCheckOf(disk); },
            [this](const Disk& disk) { return activityOn(disk); },
            [this](const Disk& disk) { return noteOn(disk); },
            [this] { return ledger_.currentRun() != nullptr ? ledger_.currentRun()->percent : 0; },
            [this](const Disk& disk) {
                return nextCheckOf(disk);
            }};
}

std::optional<LastCheck> DiskPane::lastCheckOf(const Disk& disk)
{
    const std::string key = host_.histories().keyOf(disk.facts());
    auto runs = lastRunsOf(host_.historyStore(), key, scheduled_.lastRun(key));
    // The run that is under way has no end yet, and is told as what it is.
    const bool isAtWork = !activityOn(disk).empty();
    if (!runs || (isAtWork && !runs->told.end))
        return std::nullopt;
    LastCheck check{checkOf(runs->told), std::nullopt};
    if (runs->later && !isAtWork)
        check.later = checkOf(*runs->later);
    return check;
}

std::optional<QDateTime> DiskPane::nextCheckOf(const Disk& disk)
{
    const auto next = scheduled_.nextOf(disk);
    if (!next)
        return std::nullopt;
    return QDateTime::fromSecsSinceEpoch(std::chrono::system_clock::to_time_t(*next));
}

std::string DiskPane::noteOn(const Disk& disk)
{
    return repairs_.isInterrupted(disk) ? host_.translator().text("repair interrupted")
                                        : images_.noteOn(disk);
}

std::string DiskPane::activityOn(const Disk& disk)
{
    const StartedRun* const run = ledger_.currentRun();
    if (run == nullptr || run->identifier != disk.facts().identifier)
        return {};
    return host_.translator().text(activityIn(run->task.operation));
}

std::vector<DiskRequest> DiskPane::requestsFor(DiskAction action) const
{
    std::vector<DiskRequest> requests;
    for (const auto& disk : selected())
        if (isPossible(action, *disk))
            requests.push_back(requestFor(action, *disk));
    std::erase_if(requests, [this](const DiskRequest& request) {
        return host_.diskOperations().isUnderWay(request.identifier);
    });
    return requests;
}

std::string DiskPane::reasonAgainst(DiskAction action) const
{
    const Translator& texts = host_.translator();
    const auto disks = selected();
    if (disks.empty())
        return texts.text("Select a disk first.");
    if (!requestsFor(action).empty())
        return {};
    const Disk& disk = *disks.front();
    const auto objection = objectionTo(action, disk);
    if (!objection)
        return texts.text("Not available while the disk is mounted, unmounted or ejected.");
    if (objection->kind == Refusal::Kind::AlreadySo)
        return texts.text(action == DiskAction::Mount ? "It is mounted already."
                                                      : "It is not mounted.");
    if (action == DiskAction::Eject && ImageOpener::canClose(disk))
        return texts.text("It is an image file; close it instead.");
    return texts.sentence("Not available: %@.", {reasonText(*objection, texts)});
}

// The list follows by itself; read anew all the same, for where the system cannot be watched.
void DiskPane::carryOut(std::vector<DiskRequest> requests)
{
    host_.diskOperations().start(std::move(requests),
                                 [this](const std::vector<std::string>& failures) {
                                     host_.showSheet("", failures);
                                     if (scansSystemDisks_)
                                         scan_.start();
                                 });
}

void DiskPane::attachAsDevices(const std::vector<std::string>& images)
{
    std::vector<DiskRequest> requests;
    for (const std::string& image : images)
        requests.push_back(requestToAttach(image));
    carryOut(std::move(requests));
}

void DiskPane::doToSelection(DiskAction action)
{
    if (auto requests = requestsFor(action); !requests.empty())
        carryOut(std::move(requests));
}

std::vector<std::string> DiskPane::selectedImages() const
{
    std::vector<std::string> images;
    for (const auto& disk : selected())
        if (const std::string image = disk->facts().path;
            ImageOpener::canClose(*disk) && std::ranges::count(images, image) == 0)
            images.push_back(image);
    return images;
}

void DiskPane::closeSelectedImages()
{
    closed_ = selectedImages();
    for (const auto& disk : selected())
        images_.close(*disk);
}

std::vector<std::string> DiskPane::closedImages() const
{
    const auto open = images_.openImages();
    auto images = closed_;
    std::erase_if(images,
                  [&](const std::string& image) { return std::ranges::count(open, image) != 0; });
    return images;
}

std::vector<std::string> DiskPane::recentImages() const
{
    const auto open = images_.openImages();
    auto images = recent_.files();
    std::erase_if(images,
                  [&](const std::string& image) { return std::ranges::count(open, image) != 0; });
    return images;
}

void DiskPane::openRecent(const std::string& image)
{
    std::error_code error;
    if (std::filesystem::exists(image, error) || error) {
        open({image});
        return;
    }
    recent_.remove(image);
    tellFailures({host_.translator().sentence(
        "“%@” is not there any more. It is no longer offered.", {contract::printable(image)})});
}

}  // namespace orvane::desktop
