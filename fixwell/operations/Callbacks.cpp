// SPDX-License-Identifier: Apache-2.0
#include "fixwell/jobs/ActionListEntry.h"
#include "fixwell/messagelog/LineClassifier.h"
#include "fixwell/messagelog/MessageRecord.h"
#include "fixwell/module/OVFXW.h"
#include "fixwell/operations/LaunchTable.h"

namespace fixwell {
namespace {

constexpr std::chrono::duration<double> remountDelay{2.0};

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
