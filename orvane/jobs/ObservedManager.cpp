// SPDX-License-Identifier: Apache-2.0
#include "orvane/jobs/ObservedManager.h"

namespace orvane {

using contract::Dictionary;
using contract::DiskReferencePointer;
using contract::ErrorCode;
using contract::PLRepairDisk;

class ObservedManager::ObservedRepairDisk final : public PLRepairDisk {
public:
    ObservedRepairDisk(ObservedManager& manager, std::unique_ptr<PLRepairDisk> tool)
        : manager_(manager), tool_(std::move(tool))
    {
        manager_.latest_ = this;
    }
    ~ObservedRepairDisk() override
    {
        if (manager_.latest_ == this)
            manager_.latest_ = nullptr;
    }

    ErrorCode beginStoragesystemFilesystemVerifyForDisk(const DiskReferencePointer& disk) override
    {
        return begin(disk, Operation::VerifyDisk,
                     &PLRepairDisk::beginStoragesystemFilesystemVerifyForDisk);
    }
    ErrorCode beginStoragesystemFilesystemRepairForDisk(const DiskReferencePointer& disk) override
    {
        return begin(disk, Operation::RepairDisk,
                     &PLRepairDisk::beginStoragesystemFilesystemRepairForDisk);
    }
    ErrorCode beginPermissionsVerifyForDisk(const DiskReferencePointer& disk) override
    {
        return begin(disk, Operation::VerifyPermissions,
                     &PLRepairDisk::beginPermissionsVerifyForDisk);
    }
    ErrorCode beginPermissionsRepairForDisk(const DiskReferencePointer& disk) override
    {
        return begin(disk, Operation::RepairPermissions,
                     &PLRepairDisk::beginPermissionsRepairForDisk);
    }
    ErrorCode beginPartitionMapVerifyForDisk(const DiskReferencePointer& disk) override
    {
        return begin(disk, Operation::VerifyPartitionMap,
                     &PLRepairDisk::beginPartitionMapVerifyForDisk);
    }
    ErrorCode beginPartitionMapRepairForDisk(const DiskReferencePointer& disk) override
    {
        return begin(disk, Operation::RepairPartitionMap,
                     &PLRepairDisk::beginPartitionMapRepairForDisk);
    }
    bool canRepairPartitionMapForDisk(const DiskReferencePointer& disk, ErrorCode* error) override
    {
        return tool_->canRepairPartitionMapForDisk(disk, error);
    }
    bool canRepairStoragesystemFilesystemForDisk(const DiskReferencePointer& disk,
                                                 ErrorCode* error) override
    {
        return tool_->canRepairStoragesystemFilesystemForDisk(disk, error);
    }
    bool canVerifyStoragesystemFilesystemForDisk(const DiskReferencePointer& disk,
                                                 ErrorCode* error) override
    {
        return tool_->canVerifyStoragesystemFilesystemForDisk(disk, error);
    }
    void cancelCurrentOperation() override
    {
        manager_.observer_.stopWasAsked();
        tool_->cancelCurrentOperation();
    }

private:
    ErrorCode begin(const DiskReferencePointer& disk, Operation operation,
                    ErrorCode (PLRepairDisk::*method)(const DiskReferencePointer&))
    {
        manager_.observer_.jobWillBegin(disk, operation);
        const ErrorCode error = (tool_.get()->*method)(disk);
        if (error != contract::kPLNoError)
            manager_.observer_.jobDidNotBegin(disk, error);
        return error;
    }

    ObservedManager& manager_;
    std::unique_ptr<PLRepairDisk> tool_;
};

std::string_view nameOf(Operation operation)
{
    switch (operation) {
        case Operation::VerifyDisk: return "verify";
        case Operation::RepairDisk: return "repair";
        case Operation::VerifyPermissions: return "verify-permissions";
        case Operation::RepairPermissions: return "repair-permissions";
        case Operation::VerifyPartitionMap: return "verify-partition-map";
        case Operation::RepairPartitionMap: return "repair-partition-map";
    }
    return {};
}

ObservedManager::ObservedManager(contract::PLManager& library, JobObserver& observer)
    : library_(library), observer_(observer)
{
    library_.setDelegate(this);
}

void ObservedManager::setDelegate(contract::PLAsyncDelegate* delegate)
{
    module_ = delegate;
}

std::unique_ptr<PLRepairDisk> ObservedManager::makeRepairDisk()
{
    return std::make_unique<ObservedRepairDisk>(*this, library_.makeRepairDisk());
}

void ObservedManager::cancelAgain()
{
    if (latest_ != nullptr)
        latest_->cancelCurrentOperation();
}

void ObservedManager::plAsyncStartedForDisk(const DiskReferencePointer& disk)
{
    if (module_ != nullptr)
        module_->plAsyncStartedForDisk(disk);
}

void ObservedManager::plAsyncMessageForDisk(const DiskReferencePointer& disk,
                                            std::string_view string, const Dictionary& dictionary)
{
    if (module_ != nullptr)
        module_->plAsyncMessageForDisk(disk, string, dictionary);
}

void ObservedManager::plAsyncProgressForDisk(const DiskReferencePointer& disk, bool barberPole,
                                             float percent)
{
    if (module_ != nullptr)
        module_->plAsyncProgressForDisk(disk, barberPole, percent);
}

void ObservedManager::plAsyncFinishedForDisk(const DiskReferencePointer& disk, ErrorCode mainError,
                                             ErrorCode detailError, const Dictionary& dictionary)
{
    observer_.jobWillFinish(disk, mainError, dictionary);
    if (module_ != nullptr)
        module_->plAsyncFinishedForDisk(disk, mainError, detailError, dictionary);
}

}  // namespace orvane
