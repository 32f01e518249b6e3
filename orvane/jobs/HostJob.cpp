// SPDX-License-Identifier: Apache-2.0
#include "orvane/jobs/HostJob.h"

#include "contract/foundation/Array.h"
#include "contract/pellar/ErrorCodes.h"
#include "contract/pellar/MessageKeys.h"
#include "orvane/jobs/LogRecord.h"

#include <utility>

namespace orvane {
namespace {

using contract::DiskReferencePointer;
using contract::ErrorCode;
using pellar::Operation;
using pellar::Subject;

std::string_view titleKeyOf(pellar::Task task)
{
    const bool isUndo = task.operation == Operation::Undo;
    switch (task.subject) {
        case Subject::PartitionMap:
            return isUndo ? "Undo the repair of the partition map of “%@”"
                          : "Finish the repair of the partition map of “%@”";
        case Subject::Permissions: return "Undo the repair of the permissions on “%@”";
        case Subject::Filesystem: break;
    }
    return isUndo ? "Undo the repair of “%@”" : "Finish the repair of “%@”";
}

}  // namespace

HostJob::HostJob(pellar::Manager& library, SupportHost& host, std::shared_ptr<Disk> disk,
                 Events events)
    : host_(host),
      disk_(std::move(disk)),
      events_(std::move(events)),
      tool_(library.makeTool(*this))
{
}

std::string HostJob::titleOf(pellar::Task task, const Disk& disk, const Translator& texts)
{
    return texts.sentence(titleKeyOf(task), {disk.displayName()});
}

void HostJob::begin(pellar::Task task)
{
    add(logRecord(std::nullopt, titleOf(task, *disk_, host_.translator()),
                  contract::verbosity::heading));
    if (const ErrorCode error = tool_->begin(task, disk_->theKRDisk())) {
        tellError(error);
        isOver_ = true;
    }
}

void HostJob::plAsyncStartedForDisk(const DiskReferencePointer& /*disk*/) {}

void HostJob::plAsyncMessageForDisk(const DiskReferencePointer& /*disk*/, std::string_view string,
                                    const contract::Dictionary& dictionary)
{
    const bool isProgress = dictionary && dictionary.string(contract::kFsckMessageType) ==
                                              contract::kFsckProgress.text();
    if (isProgress) {
        const contract::Array parameters = dictionary[contract::kFsckParameters].array();
        if (events_.progressed && !parameters.isEmpty())
            events_.progressed(parameters.front().real());
    } else if (dictionary)
        add(logRecordOf(dictionary));
    else
        add(logRecord(std::nullopt, std::string(string), contract::verbosity::fine));
}

void HostJob::plAsyncProgressForDisk(const DiskReferencePointer& /*disk*/, bool /*barberPole*/,
                                     float /*percent*/)
{
}

void HostJob::plAsyncFinishedForDisk(const DiskReferencePointer& /*disk*/, ErrorCode mainError,
                                     ErrorCode /*detailError*/,
                                     const contract::Dictionary& /*dictionary*/)
{
    if (mainError != contract::kPLNoError && mainError != contract::kPLErrorCancelled)
        tellError(mainError);
    isOver_ = true;
}

void HostJob::add(const contract::Dictionary& record)
{
    disk_->fsckHistoryNoChildren().append(record);
    if (events_.rowAdded)
        events_.rowAdded();
}

void HostJob::tellError(ErrorCode error)
{
    add(lineOfRun(logRecord(contract::kFsckFail, host_.OVLocalizedErrorString(error),
                            contract::verbosity::heading)));
}

}  // namespace orvane
