// SPDX-License-Identifier: Apache-2.0
#include "orvane/jobs/JobLedger.h"

#include "contract/pellar/ErrorCodes.h"
#include "contract/pellar/MessageKeys.h"
#include "orvane/jobs/LogRecord.h"
#include "pellar/disks/LoopDevice.h"

#include <sys/stat.h>

#include <algorithm>
#include <chrono>
#include <utility>

namespace orvane {
namespace {

std::chrono::system_clock::time_point now()
{
    return std::chrono::system_clock::now();
}

std::string failedVerdict()
{
    return std::string(contract::kPLVerdictFailed.text());
}

bool hasAnswer(const Run& run)
{
    if (!run.end)
        return false;
    const std::string& verdict = run.end->verdict;
    return verdict == contract::kPLVerdictSound.text() ||
           verdict == contract::kPLVerdictDamaged.text() ||
           verdict == contract::kPLVerdictRepaired.text() ||
           verdict == contract::kPLVerdictUndone.text();
}

}  // namespace

void JobLedger::jobWillBegin(const contract::DiskReferencePointer& reference, pellar::Task task)
{
    // What was said until now has its time before this run's.
    host_.histories().saveNew();
    const bool isOfImage =
        reference && reference->storage == contract::DiskReference::Storage::FileRegion;
    image_ = isOfImage ? reference->path : std::filesystem::path();
    const auto disk =
        std::dynamic_pointer_cast<Disk>(host_.sharedDiskController().diskWithKRDisk(reference));
    number_ = disk ? host_.historyStore().beginRun(host_.histories().keyOf(disk->facts()),
                                                   nameOf(task), now())
                   : 0;
    run_ = {task, reference ? reference->name : std::string(),
            reference ? reference->identifier : std::string()};
    isRunning_ = true;
    events_.began(run_, reference);
}

void JobLedger::jobDidNotBegin(const contract::DiskReferencePointer& /*disk*/,
                               contract::ErrorCode error)
{
    end({failedVerdict(), error, host_.OVLocalizedErrorString(error)});
}

// Where the result names no verdict, the error decides.
void JobLedger::jobWillFinish(const contract::DiskReferencePointer& /*disk*/,
                              contract::ErrorCode error, const contract::Dictionary& result)
{
    std::string verdict(result.string(contract::kPLVerdict));
    if (verdict.empty())
        verdict = error == 0 ? std::string(contract::kPLVerdictSound.text()) : failedVerdict();
    end({verdict, error, std::string(result.string(contract::kPLMessage)),
         std::string(result.string(contract::kPLTool)), result.integer(contract::kPLProblems),
         result.integer(contract::kPLProblemKinds), result.boolean(contract::kPLHasLosses)});
}

void JobLedger::jobDidProgress(const contract::DiskReferencePointer& /*disk*/, double percent)
{
    run_.percent = percent;
    if (events_.progressed)
        events_.progressed(run_);
}

void JobLedger::stopWasAsked()
{
    if (events_.stopAsked)
        events_.stopAsked();
}

void JobLedger::end(const RunEnd& end)
{
    if (const std::int64_t number = std::exchange(number_, 0); number != 0)
        host_.historyStore().endRun(number, end, now());
    isRunning_ = false;
    events_.ended(run_, end);
}

std::string JobLedger::withDevice(contract::ErrorCode error, std::string text) const
{
    const bool isInUse = error == contract::kPLErrorDiskInUse ||
                         error == contract::kOVErrorDiskInUse ||
                         error == contract::kOVErrorCannotRepairInUse;
    struct stat status = {};
    if (!isInUse || image_.empty() || ::stat(image_.c_str(), &status) != 0)
        return text;
    const std::string device =
        pellar::loopDeviceOn(status.st_dev, status.st_ino, pellar::SystemPaths());
    return device.empty()
               ? text
               : text + " " + host_.translator().sentence("The image is attached as %@.", {device});
}

std::optional<LastRuns> lastRunsOf(HistoryStore& store, std::string_view key)
{
    auto last = store.lastRun(key);
    if (!last || hasAnswer(*last))
        return last ? std::optional(LastRuns{*std::move(last), std::nullopt}) : std::nullopt;
    return lastRunsIn(store.runs(key));
}

std::optional<LastRuns> lastRunsOf(HistoryStore& store, std::string_view key, const Run* other)
{
    if (other == nullptr)
        return lastRunsOf(store, key);
    std::vector<Run> runs = store.runs(key);
    // Whoever keeps the run itself knows more of it.
    const auto newer =
        std::ranges::find_if(runs, [&](const Run& run) { return run.started >= other->started; });
    if (newer == runs.end() || newer->started != other->started)
        runs.insert(newer, *other);
    return lastRunsIn(runs);
}

std::optional<LastRuns> lastRunsIn(const std::vector<Run>& runs)
{
    if (runs.empty())
        return std::nullopt;
    const auto told = std::find_if(runs.rbegin(), runs.rend(), hasAnswer);
    if (told == runs.rend())
        return LastRuns{runs.back(), std::nullopt};
    const auto later = told == runs.rbegin() ? std::nullopt : std::optional(runs.back());
    return LastRuns{*told, later};
}

void keepUnreached(SupportHost& host, Disk& image, pellar::Operation operation,
                   const std::string& sentence)
{
    // As of every run, its first record is saved before it begins.
    image.fsckHistoryNoChildren().append(
        logRecord(contract::kFsckFail, sentence, contract::verbosity::heading));
    host.histories().saveNew();
    HistoryStore& store = host.historyStore();
    const auto time = now();
    const std::int64_t run =
        store.beginRun(host.histories().keyOf(image.facts()),
                       nameOf(pellar::Task{pellar::Subject::Filesystem, operation}), time);
    store.endRun(run, {failedVerdict(), contract::kPLErrorCannotOpen, sentence}, time);
}

}  // namespace orvane
