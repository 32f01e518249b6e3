// SPDX-License-Identifier: Apache-2.0
#include "orvane/privileges/UndoneJob.h"

namespace orvane {
namespace {

using pellar::Subject;

std::string_view attemptOf(const HelperRequest& request)
{
    const bool isRepair = request.operation == pellar::Operation::Repair;
    if (request.subject == Subject::Permissions)
        return isRepair ? "cannot repair the permissions on “%1$@”: %2$@"
                        : "cannot verify the permissions on “%1$@”: %2$@";
    if (request.subject == Subject::PartitionMap)
        return isRepair ? "cannot repair the partition map of “%1$@”: %2$@"
                        : "cannot verify the partition map of “%1$@”: %2$@";
    return isRepair ? "cannot repair “%1$@”: %2$@" : "cannot verify “%1$@”: %2$@";
}

}  // namespace

void tellUndone(const Undone& undone, const HelperRequest& request, const pellar::Texts& texts,
                pellar::JobLog& log)
{
    const std::string message =
        pellar::Sentence{attemptOf(request), log.diskName(), undone.reason.in(texts)}.in(texts);
    log.failure(message);
    log.finished(undone.error, 0, undone.verdict, message);
}

}  // namespace orvane
