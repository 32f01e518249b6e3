// SPDX-License-Identifier: Apache-2.0
#include "fixwell/history/CompletionReport.h"

#include "fixwell/jobs/ActionListEntry.h"
#include "fixwell/messagelog/MessageRecord.h"

#include <array>

namespace fixwell {
namespace {

Name actionTypeKey(std::int64_t action)
{
    switch (action) {
        case FXWActionRepairDisk: return kOVOP_RepairDiskKey;
        case FXWActionRepairPermissions: return kOVOP_RepairDiskPermissionsKey;
        case FXWActionVerifyPermissions: return kOVOP_VerifyDiskPermissionsKey;
        default: return kOVOP_VerifyDiskKey;
    }
}

bool isPermissionOperation(const Dictionary& entry)
{
    const std::int64_t type = entry.integer(kFXW_OperationType);
    return type == FXWOperationVerifyPermissions || type == FXWOperationRepairPermissions;
}

}  // namespace

Dictionary makeCompletionReport(const Array& completedList)
{
    const Dictionary report = Dictionary::make();
    if (completedList.isEmpty()) {
        report.set(kOVOP_ResultKey, kOVOP_FailKey);
        return report;
    }
    const Dictionary first = completedList.front().dictionary();
    report.set(kOVOP_ResultKey, kOVOP_SuccessKey);
    report.set(kOVOP_DiskIdentifierKey, first[kEntryDiskIdentifier]);
    report.set(kOVOP_DiskKey, first[kEntryDisk]);
    report.set(kOVOP_ActionTypeKey, actionTypeKey(first.integer(kEntryAction)));
    return report;
}

std::optional<PostedWarning> warningToPost(const Array& completedList)
{
    Value last;
    for (const Value& value : completedList.values()) {
        const Dictionary entry = value.dictionary();
        if (isPermissionOperation(entry))
            continue;
        last = entry[kEntryPostWarning];
        if (!last.string().empty())
            return PostedWarning{std::string(entry.string(kEntryPostWarningTitle)),
                                 std::string(last.string())};
    }
    if (last.isNone())
        return std::nullopt;
    return PostedWarning{};
}

Dictionary makeSummaryRecord(const Array& history)
{
    const std::array types{kFsckVerify, kFsckRepair, kFsckError, kFsckSuccess, kFsckFail};
    std::array<std::int64_t, types.size()> counts{};
    for (auto record = history.values().rbegin(); record != history.values().rend(); ++record) {
        const Dictionary message = record->dictionary();
        if (verbosityOf(message) < verbosity::main)
            break;
        for (std::size_t i = 0; i < types.size(); ++i)
            counts[i] += message.string(kFsckMessageType) == types[i].text() ? 1 : 0;
    }

    const Dictionary summary =
        Dictionary::of({{kOV_finalAttributedString_type, StyledText::make("\n")},
                        {kFsckVerbosity, verbosity::summary}});
    for (std::size_t i = 0; i < types.size(); ++i)
        summary.set(types[i], counts[i]);
    return summary;
}

}  // namespace fixwell
