// SPDX-License-Identifier: Apache-2.0
#include "contract/pellar/ErrorCodes.h"
#include "contract/pellar/MessageKeys.h"
#include "orvane/jobs/UnavailableReason.h"
#include "orvane/support/systemd/CheckTimers.h"
#include "orvane/terminal/CheckResult.h"
#include "orvane/terminal/Commands.h"

#include <unistd.h>

#include <algorithm>
#include <array>

namespace orvane {
namespace {

using Clock = std::chrono::system_clock;

bool isBad(std::string_view verdict)
{
    return verdict == contract::kPLVerdictDamaged.text();
}

// sd-daemon(3): 3 an error, 4 a warning, 5 a notice, 6 information.
std::string priorityOf(const CheckResult& result)
{
    if (!result.skipped.empty())
        return result.facts.hasSMARTError ? "4" : "5";
    if (isBad(result.run.verdict()))
        return "3";
    return exitStatusFor(result.run.verdict()) == exitSound ? "6" : "4";
}

/// It was in use, which nothing could know before.
bool isInUse(const RunEnd& end)
{
    constexpr std::array codes{contract::kPLErrorDiskInUse, contract::kPLErrorCouldNotUnmount,
                               contract::kOVErrorDiskInUse, contract::kOVErrorCannotRepairInUse};
    return std::ranges::find(codes, end.errorCode) != codes.end();
}

bool isVolume(const Disk& disk)
{
    return disk.facts().isShown && !disk.facts().isWhole &&
           disk.facts().type != diskType::container && disk.facts().type != diskType::freeSpace;
}

/// The check of one disk after the other, and what becomes of its results.
class ScheduledCheck {
public:
    ScheduledCheck(Session& session, Reporter& reporter) : session_(session), reporter_(reporter) {}

    /// The disk, or the volumes in it; NO where it has none.
    bool check(const NamedDisk& named)
    {
        std::vector<NamedDisk> volumes;
        if (named.disk->isOfflineDiskImage() || isVolume(*named.disk))
            volumes.push_back(named);
        else
            for (const std::shared_ptr<Disk>& part : withParts(named.disk))
                if (isVolume(*part))
                    volumes.push_back({session_.names().nameOf(part->facts().identifier), part});
        for (const NamedDisk& volume : volumes)
            checkOne(volume);
        return !volumes.empty();
    }

    void skip(const NamedDisk& named, const std::string& why)
    {
        tell({named.name, named.disk->facts(), {}, why});
    }

    int status() const { return status_; }

private:
    void checkOne(const NamedDisk& named)
    {
        if (session_.wasStopped())
            return;
        if (const std::string why = whySkipped(named.disk); !why.empty())
            return skip(named, why);
        const auto known = session_.outcomes();
        const Clock::time_point began = Clock::now();
        session_.select({named.disk});
        session_.host().sharedDiskController().hold({named.disk});
        session_.pressAndWait(session_.button(contract::outlet::verifyDisk));
        session_.host().sharedDiskController().release();
        bool wasReached = false;
        for (const auto& [identifier, end] : session_.outcomes())
            if (GivenNames::isWithin(identifier, named.disk->facts().identifier) &&
                !known.contains(identifier)) {
                wasReached = true;
                settle(named, identifier, end, began);
            }
        if (!wasReached && !session_.wasStopped())
            fail(named, began);
        if (session_.wasStopped())
            status_ |= exitStopped;
    }

    std::string whySkipped(const std::shared_ptr<Disk>& disk)
    {
        session_.select({disk});
        const TerminalButton& verify = session_.button(contract::outlet::verifyDisk);
        if (!verify.isEnabled())
            return unavailableReason(session_, verify, *disk);
        const auto* const filesystem = disk->filesystem();
        const bool canStayMounted = filesystem != nullptr && filesystem->supportsLiveVerify();
        if (disk->isMounted() && !canStayMounted)
            return session_.texts().sentence(
                "It is mounted at %@, and a scheduled check unmounts nothing.",
                {contract::printable(disk->facts().mountPoint)});
        // fsck.f2fs opens a disk for writing, though it is to write nothing. A unit may forbid
        // that.
        if (disk->facts().filesystem == "f2fs" && ::access(disk->facts().path.c_str(), W_OK) != 0)
            return session_.texts().text(
                "Its tool opens it for writing, though it writes nothing, and that is not allowed "
                "here.");
        return {};
    }

    void settle(const NamedDisk& named, const std::string& identifier, const RunEnd& end,
                Clock::time_point began)
    {
        CheckResult result{session_.names().nameOf(identifier),
                           factsOf(named, identifier),
                           {"verify", began, Clock::now(), end},
                           {}};
        // Its history knows the times to the millisecond, by which this run is known again.
        if (const auto last = session_.host().historyStore().lastRun(keyOf(result)))
            if (last->started >= began - std::chrono::milliseconds(1)) {
                result.run.started = last->started;
                result.run.finished = last->finished.value_or(*result.run.finished);
            }
        if (isInUse(end))
            result.skipped = end.message;
        tell(result);
    }

    /// No job reached it: an image that cannot be read.
    void fail(const NamedDisk& named, Clock::time_point began)
    {
        const RunEnd end{std::string(contract::kPLVerdictFailed.text()),
                         contract::kPLErrorCannotOpen,
                         whyUnreached(session_.host(), *named.disk, named.name)};
        tell({named.name, named.disk->facts(), {"verify", began, Clock::now(), end}, {}});
    }

    /// Of the disk, or of a part of an image.
    DiskFacts factsOf(const NamedDisk& named, const std::string& identifier) const
    {
        const auto& contents = named.disk->contents();
        for (const auto& disk : withParts(contents ? contents : named.disk))
            if (disk->facts().identifier == identifier)
                return disk->facts();
        return named.disk->facts();
    }

    std::string keyOf(const CheckResult& result)
    {
        return session_.host().histories().keyOf(result.facts);
    }

    void tell(const CheckResult& result)
    {
        const bool isSkipped = !result.skipped.empty();
        const std::string sentence =
            isSkipped ? session_.texts().sentence("“%@” was not checked: %@",
                                                  {result.name, result.skipped})
                      : session_.texts().sentence(
                            "“%@” was checked: %@. %@",
                            {result.name, session_.texts().text(result.run.verdict()),
                             result.run.end->message});
        writeToJournal(journalFieldsOf(result, sentence));
        reporter_.done(result.name, isSkipped ? "skip" : "check", "", sentence);
        publish(result);
        if (!isSkipped)
            status_ |= exitStatusFor(result.run.verdict());
    }

    void publish(const CheckResult& result)
    {
        const std::filesystem::path directory = checksDirectory(userXDGPaths());
        const std::string& path = result.facts.path.native();
        // The path of an image may be nobody else's business.
        const bool isForEverybody = path.starts_with("/dev/") && !path.starts_with("/dev/shm/");
        if (directory.empty() || (directory == systemChecks && !isForEverybody))
            return;
        PublishedCheck check{path, result.facts.uuid, std::nullopt, std::nullopt};
        if (result.skipped.empty())
            check.run = result.run;
        else
            check.skipped = Clock::now();
        if (const auto kept = publishCheck(directory, keyOf(result), std::move(check)); !kept)
            reporter_.warning(kept.error().message);
    }

    Session& session_;
    Reporter& reporter_;
    int status_ = 0;
};

std::vector<NamedDisk> disksOfTheSystem(Session& session)
{
    session.host().refreshDisks();
    std::vector<NamedDisk> disks;
    for (const std::shared_ptr<Disk>& disk : session.host().sharedDiskController().roots())
        disks.push_back({disk->facts().identifier, disk});
    return disks;
}

}  // namespace

std::vector<JournalField> journalFieldsOf(const CheckResult& result, const std::string& sentence)
{
    const bool isSkipped = !result.skipped.empty();
    std::vector<JournalField> fields{
        {"MESSAGE", contract::printable(sentence)},
        {"MESSAGE_ID", isSkipped ? skippedMessage : checkedMessage},
        {"PRIORITY", priorityOf(result)},
        {"SYSLOG_IDENTIFIER", "fixwell"},
        {"FIXWELL_VERDICT", isSkipped ? "skipped" : result.run.verdict()},
        {"FIXWELL_DISK", result.name},
        {"FIXWELL_DEVICE", result.facts.path.native()},
        {"FIXWELL_UUID", result.facts.uuid},
        {"FIXWELL_LABEL", result.facts.label},
        {"FIXWELL_FILESYSTEM", result.facts.filesystem}};
    if (isSkipped) {
        fields.push_back({"FIXWELL_REASON", result.skipped});
        return fields;
    }
    fields.push_back({"FIXWELL_PROBLEMS", std::to_string(result.run.end->problems)});
    fields.push_back({"FIXWELL_TOOL", result.run.end->tool});
    if (result.run.finished)
        fields.push_back({"FIXWELL_DURATION_MS",
                          std::to_string(std::chrono::duration_cast<std::chrono::milliseconds>(
                                             *result.run.finished - result.run.started)
                                             .count())});
    return fields;
}

int runScheduledCheck(const Request& request, Session& session, Reporter& reporter)
{
    int status = 0;
    std::vector<std::string> names = request.disks;
    if (request.unitInstance)
        names = {nameOfInstance(*request.unitInstance)};
    const bool isOfAll = names.empty() || (request.unitInstance && names.front() == "all");
    const auto disks = isOfAll ? disksOfTheSystem(session) : session.findDisks(names, status);
    ScheduledCheck scheduled(session, reporter);
    for (const NamedDisk& named : disks)
        if (!scheduled.check(named) && !isOfAll)
            scheduled.skip(named, session.texts().text("There is no volume on it."));
    return status | scheduled.status();
}

}  // namespace orvane
