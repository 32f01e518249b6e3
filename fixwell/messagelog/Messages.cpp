// SPDX-License-Identifier: Apache-2.0
#include "fixwell/jobs/ActionListEntry.h"
#include "fixwell/messagelog/MessageRecord.h"
#include "fixwell/messagelog/ParameterSubstitution.h"
#include "fixwell/module/OVFXW.h"

namespace fixwell {
namespace {

/// The library's own verbosity, except where the type decides.
std::int64_t verbosityOfMessage(const Dictionary& message)
{
    const std::string_view type = message.string(kFsckMessageType);
    if (type == kFsckVerify.text() || type == kFsckRepair.text())
        return verbosity::detail;
    if (type == kFsckError.text())
        return verbosity::heading;
    return message.integer(kFsckVerbosity);
}

}  // namespace

std::string OVFXW::doParameterSubstitutionForMessageString(const Dictionary& message) const
{
    return substitutedParameters(
        message.string(kFsckMessageString), message[kFsckParameters].array(),
        [this](const Value& number) { return host().decimalString(number); });
}

void OVFXW::repairOutputDictionary(const Dictionary& message, std::string_view string,
                                   const OVDiskPointer& disk)
{
    ov_log(
        OVLog::trace, "repairOutputDictionary for %@: %@\n",
        [&] { return disk ? disk->diskIdentifier() : std::string("(none)"); },
        [&] { return Value(message).description(); });
    const OVDiskPointer inflight = diskOfEntry(inflightItem);
    if (!inflight || !disk || !message) {
        ov_log(OVLog::trace, "repairOutputDictionary disk or output not valid\n");
        return;
    }
    if (!message.string(kFsckMessageString).empty()) {
        if (inflight != disk && !inflight->isEqual(*disk))
            ov_log(OVLog::mismatch, "inflight disk (%s) not matching repairOutput disk (%@)\n",
                   inflight->diskIdentifier(), disk->diskIdentifier());
        addMessageRecord(message, string, verbosityOfMessage(message), inflight);
    }
    const Array parameters = message[kFsckParameters].array();
    if (message.string(kFsckMessageType) == kFsckProgress.text() && !parameters.isEmpty())
        plAsyncProgressForDisk(disk->theKRDisk(), false,
                               static_cast<float>(parameters.front().real()));
}

void OVFXW::addMessageRecord(const Dictionary& message, std::string_view string, std::int64_t level,
                             const OVDiskPointer& inflight)
{
    const Dictionary record = message.mutableCopy();
    record.set(kOV_typeOfOutputKey, kOV_typeOfOutput_dict);
    const StyledText text = attributedStringForContext(
        record,
        string.empty() ? doParameterSubstitutionForMessageString(message) : std::string(string));
    text.append("\n");
    record.set(kOV_finalAttributedString_type, text);
    record.set(kFsckVerbosity, level);
    const Array history = inflight->fsckHistoryNoChildren();
    addObjectAndUpdateView(history, record, forcesReloadOfDiskCheck(history));
}

bool OVFXW::forcesReloadOfDiskCheck(const Array& history) const
{
    constexpr std::size_t promptRecords = 99;
    return isDiskAction(action) && history.size() <= promptRecords;
}

void OVFXW::appendMessage(std::string_view text, std::optional<Name> type, std::int64_t level)
{
    const OVDiskPointer disk = searchForInflightDisk();
    if (!disk) {
        ov_log(OVLog::trace, "No inflight item for appendMessage: %@\n", text);
        return;
    }
    const Dictionary record = Dictionary::of({{kOV_typeOfOutputKey, kOV_typeOfOutput_OV_addition}});
    if (type)
        record.set(kFsckMessageType, *type);
    record.set(kFsckVerbosity, level);
    record.set(kOV_finalAttributedString_type, attributedStringForContext(record, text));
    addObjectAndUpdateView(disk->fsckHistoryNoChildren(), record, level < verbosity::detail);
}

}  // namespace fixwell
