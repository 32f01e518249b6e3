// SPDX-License-Identifier: Apache-2.0
#include "fixwell/jobs/ActionListEntry.h"
#include "fixwell/messagelog/ColorMarkers.h"
#include "fixwell/messagelog/MessageRecord.h"
#include "fixwell/module/Localizable.h"
#include "fixwell/module/OVFXW.h"
#include "fixwell/operations/InUseErrors.h"
#include "fixwell/operations/OverallProgress.h"

namespace fixwell {
namespace {

// What the newer permissions tool reports first, while it reads its database.
constexpr float readingDatabasePercent = 20.0F;
constexpr std::chrono::seconds readingDatabaseTime{60};
constexpr std::chrono::duration<double> remountDelay{2.0};

std::string identifierOf(const OVDiskPointer& disk)
{
    return disk ? disk->diskIdentifier() : std::string("(none)");
}

}  // namespace

void OVFXW::plAsyncStartedForDisk(const DiskReferencePointer& /*disk*/) {}

void OVFXW::plAsyncMessageForDisk(const DiskReferencePointer& reference, std::string_view string,
                                  const Dictionary& dictionary)
{
    const OVDiskPointer disk = diskController().findOrCreateOVDisk(reference);
    if (dictionary) {
        repairOutputDictionary(dictionary, string, disk);
        return;
    }
    const OVDiskPointer inflight = diskOfEntry(inflightItem);
    ov_log(
        OVLog::trace, "plAsyncMessageForDisk (%@): %@", [&] { return identifierOf(disk); }, string);
    if (!inflight || !disk || string.data() == nullptr) {
        ov_log(OVLog::trace, "repairOutput disk or output line not valid\n");
        return;
    }
    if (inflight != disk && !inflight->isEqual(*disk))
        ov_log(OVLog::mismatch, "inflight disk (%s) not matching repairOutput disk (%@)\n",
               inflight->diskIdentifier(), disk->diskIdentifier());
    addTextLine(inflight, string);
}

// The tool's own lines end in a line feed; one is added only where a line was cut or is not
// classified, so that a marked error keeps its line break.
OVFXW::TextLine OVFXW::classifiedLine(std::string_view line)
{
    if (!isDiskAction(action))
        return {line, {}, verbosity::fine, true};
    if (scanForSpecialChars(line))
        return {removeSpecialChars(line), kFsckError, verbosity::main, true};
    switch (scanForType(line)) {
        case FXWLineFailure: return {line, kFsckError, verbosity::main, true};
        case FXWLineRepairing: return {line, kFsckRepair, verbosity::main, false};
        case FXWLineSuccess: return {line, kFsckSuccess, verbosity::main, false};
        default: return {line, {}, verbosity::fine, false};
    }
}

void OVFXW::addTextLine(const OVDiskPointer& disk, std::string_view line)
{
    const TextLine classified = classifiedLine(line);
    const Dictionary record = Dictionary::of({{kOV_typeOfOutputKey, kOV_typeOfOutput_string},
                                              {kFsckMessageType, classified.type},
                                              {kFsckVerbosity, classified.level}});
    const StyledText text = attributedStringForContext(record, classified.text);
    if (classified.addsLineFeed)
        text.append("\n");
    record.set(kOV_finalAttributedString_type, text);
    const Array history = disk->fsckHistoryNoChildren();
    addObjectAndUpdateView(history, record, forcesReloadOfDiskCheck(history));
}

void OVFXW::plAsyncProgressForDisk(const DiskReferencePointer& reference, bool barberPole,
                                   float percent)
{
    ov_log(
        OVLog::trace, "plAsyncProgressForDisk (%@): barberPole=%s, percent=%.1f\n",
        [&] { return identifierOf(diskController().diskWithKRDisk(reference)); },
        [&] { return host().hostBundle().localizedString(barberPole ? "Yes" : "No"); },
        static_cast<double>(percent));
    if (!(percent > 0) || !(percent < 100))
        return;
    if (_jobStarted)
        percent = rescaledForKestron(percent);
    else if (!noteFirstProgress(percent))
        return;
    if (action != FXWActionNone)
        showOverallProgress(percent);
}

/// NO when the report only says that a database is being read, and the bar is to stay as it is.
bool OVFXW::noteFirstProgress(float percent)
{
    _jobStarted = true;
    if (percent != readingDatabasePercent) {
        if (inflightItem)
            inflightItem.set(kFXW_OSVersionKey, kFXW_DISK_IS_MORLA);
        windowController().setGlobalProgressBarIndeterminate(false);
        return true;
    }
    const std::string reading = localized(localizable("\tReading permissions database."));
    appendTitleToMessageText(format("%@\n", {reading}));
    appendTitleToMessageText(
        format("%@\n", {localized(localizable(
                           "\tReading the permissions database can take several minutes.\n"))}));
    windowController().setGlobalProgressText(reading);
    if (inflightItem)
        inflightItem.set(kFXW_OSVersionKey, kFXW_DISK_IS_KESTRON);
    return false;
}

float OVFXW::rescaledForKestron(float percent)
{
    if (inflightItem.string(kFXW_OSVersionKey) != kFXW_DISK_IS_KESTRON.text())
        return percent;
    if (!inflightItem.has(kFXW_FirstKestronUpdate)) {
        inflightItem.set(kFXW_FirstKestronUpdate, kFXW_FirstKestronUpdate);
        if (totalActionsInJob == 1 && _timeEstimator)
            _timeEstimator->setStartTimeWithPercentComplete(
                host().threads().now() - readingDatabaseTime, kestronPercent(percent));
        windowController().setGlobalProgressBarIndeterminate(false);
    }
    return static_cast<float>(kestronPercent(percent));
}

void OVFXW::showOverallProgress(float percent)
{
    const double overall = overallPercent(currentJob, totalActionsInJob, percent);
    windowController().setGlobalProgressBarValue(overall);
    setActionMessageWithPercentComplete(overall);
}

void OVFXW::plAsyncFinishedForDisk(const DiskReferencePointer& reference, ErrorCode mainError,
                                   ErrorCode /*detailError*/, const Dictionary& dictionary)
{
    const OVDiskPointer disk = diskController().diskWithKRDisk(reference);
    ov_log(
        OVLog::trace, "plAsyncFinishedForDisk (%@) %@", [&] { return identifierOf(disk); },
        [&] { return dictionary ? Value(dictionary).description() : std::string(); });
    if (mainError == kPLNoError)
        noteSuccess();
    else
        noteFailure(disk, mainError);
    processActionList();
}

void OVFXW::noteFailure(const OVDiskPointer& disk, ErrorCode code)
{
    const auto type = static_cast<FXWOperationType>(inflightItem.integer(kFXW_OperationType));
    code = restatedFinishError(code, type, disk.get());
    const std::string error = host().OVLocalizedErrorString(code);
    ov_log(OVLog::error, "repairError:  %@ - %ld\n", error, code);
    if (code != kPLErrorCancelled) {
        std::string name = disk ? disk->displayName() : std::string();
        if (name.empty())
            name = inflightItem.string(kEntryVolumeName);
        appendErrorTitleToMessageText(localizedFormat(localizable("Error: %@"), error));
        appendErrorTitleToMessageText("\n");
        const std::string title = format(actionDescription(), {name});
        host().log().log(format("%@: %@", {title, error}));
        if (inflightItem) {
            inflightItem.set(kEntryPostWarning, error);
            inflightItem.set(kEntryPostWarningTitle, title);
        }
    }
    fileInflightItem();
    if (!disk || !hasMountPoint(*disk))
        diskController().mountDisk(disk, true, false);
}

void OVFXW::noteSuccess()
{
    const std::int64_t type = inflightItem.integer(kFXW_OperationType);
    if (type == FXWOperationVerifyDisk || type == FXWOperationRepairDisk)
        host().log().log(localized(localizable("Repair tool completed: ")));
    createDiskSummaryRecord();
    if (inflightItem && (_stoppedByUser || inflightItem.boolean(kEntryStoppedByUser)))
        host().mainRunLoop().scheduleTimer(remountDelay, [module = liveness_] {
            if (*module != nullptr)
                (*module)->delayedMountDisk();
        });
    fileInflightItem();
}

void OVFXW::fileInflightItem()
{
    if (inflightItem)
        addDiskToCompletedList(inflightItem);
    inflightItem = {};
}

}  // namespace fixwell
