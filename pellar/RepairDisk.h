// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/RunLoop.h"
#include "contract/pellar/PLRepairDisk.h"
#include "pellar/ManagerOptions.h"
#include "pellar/jobs/Job.h"
#include "pellar/jobs/JobScript.h"
#include "pellar/texts/Texts.h"
#include "pellar/outcome/Operation.h"

#include <memory>
#include <vector>

namespace pellar {

/// The library's tool of one module. The references, and the delegate, outlive it.
class RepairDisk final : public contract::PLRepairDisk {
public:
    RepairDisk(contract::RunLoop& loop, const Texts& texts, const ManagerOptions& options,
               contract::PLAsyncDelegate& delegate);

    contract::ErrorCode beginStoragesystemFilesystemVerifyForDisk(
        const contract::DiskReferencePointer& disk) override;
    contract::ErrorCode beginStoragesystemFilesystemRepairForDisk(
        const contract::DiskReferencePointer& disk) override;
    contract::ErrorCode beginPermissionsVerifyForDisk(
        const contract::DiskReferencePointer& disk) override;
    contract::ErrorCode beginPermissionsRepairForDisk(
        const contract::DiskReferencePointer& disk) override;
    contract::ErrorCode beginPartitionMapVerifyForDisk(
        const contract::DiskReferencePointer& disk) override;
    contract::ErrorCode beginPartitionMapRepairForDisk(
        const contract::DiskReferencePointer& disk) override;

    bool canRepairPartitionMapForDisk(const contract::DiskReferencePointer& disk,
                                      contract::ErrorCode* error) override;
    bool canRepairStoragesystemFilesystemForDisk(const contract::DiskReferencePointer& disk,
                                                 contract::ErrorCode* error) override;
    bool canVerifyStoragesystemFilesystemForDisk(const contract::DiskReferencePointer& disk,
                                                 contract::ErrorCode* error) override;

    void cancelCurrentOperation() override;

private:
    contract::ErrorCode begin(const contract::DiskReferencePointer& disk, Operation operation);
    contract::ErrorCode beginMounted(const contract::DiskReferencePointer& disk, Operation operation,
                                    contract::ErrorCode error);
    contract::ErrorCode beginPartitionMap(const contract::DiskReferencePointer& disk,
                                         Operation operation);
    contract::ErrorCode beginPermissions(const contract::DiskReferencePointer& disk,
                                        Operation operation);
    contract::ErrorCode refusal(const contract::DiskReferencePointer& disk,
                               Operation operation) const;
    bool beginPrivileged(Subject subject, const contract::DiskReferencePointer& disk,
                         Operation operation);
    bool isPartThatOthersAttach(const JobRequest& request) const;
    void startVolume(JobRequest request);
    void startLive(const contract::DiskReferencePointer& disk,
                   const std::vector<Mount>& mounts);
    void start(const contract::DiskReferencePointer& disk, const ScriptMaker& makeScript);

    contract::RunLoop& loop_;
    const Texts& texts_;
    const ManagerOptions& options_;
    contract::PLAsyncDelegate& delegate_;
    std::unique_ptr<Job> job_;
};

}  // namespace pellar
