// SPDX-License-Identifier: Apache-2.0
#include "fixwell/history/CompletionReport.h"

#include "fixwell/jobs/ActionListEntry.h"

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

}  // namespace fixwell
