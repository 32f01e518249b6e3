// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "fixwell/host/foundation/RunLoop.h"
#include "fixwell/host/pellar/PLRepairDisk.h"
#include "pellar/ManagerOptions.h"
#include "pellar/Texts.h"
#include "pellar/jobs/Job.h"
#include "pellar/jobs/JobScript.h"
#include "pellar/tools/Operation.h"

#include <memory>
#include <vector>

namespace pellar {

/// The library's tool of one module. The references, and the delegate, outlive it.
class RepairDisk final : public fixwell::PLRepairDisk {
public:
    RepairDisk(fixwell::RunLoop& loop, const Texts& texts, const ManagerOptions& options,
               fixwell::PLAsyncDelegate& delegate);

    fixwell::ErrorCode beginStoragesystemFilesystemVerifyForDisk(
        const fixwell::DiskReferencePointer& disk) override;
    fixwell::ErrorCode beginStoragesystemFilesystemRepairForDisk(
        const fixwell::DiskReferencePointer& disk) override;
    fixwell::ErrorCode beginPermissionsVerifyForDisk(
        const fixwell::DiskReferencePointer& disk) override;
    fixwell::ErrorCode beginPermissionsRepairForDisk(
        const fixwell::DiskReferencePointer& disk) override;
    fixwell::ErrorCode beginPartitionMapVerifyForDisk(
        const fixwell::DiskReferencePointer& disk) override;
    fixwell::ErrorCode beginPartitionMapRepairForDisk(
        const fixwell::DiskReferencePointer& disk) override;

    bool canRepairPartitionMapForDisk(const fixwell::DiskReferencePointer& disk,
                                      fixwell::ErrorCode* error) override;
    bool canRepairStoragesystemFilesystemForDisk(const fixwell::DiskReferencePointer& disk,
                                                 fixwell::ErrorCode* error) override;
    bool canVerifyStoragesystemFilesystemForDisk(const fixwell::DiskReferencePointer& disk,
                                                 fixwell::ErrorCode* error) override;

    void cancelCurrentOperation() override;

private:
    fixwell::ErrorCode begin(const fixwell::DiskReferencePointer& disk, Operation operation);
    fixwell::ErrorCode beginMounted(const fixwell::DiskReferencePointer& disk, Operation operation,
                                    fixwell::ErrorCode error);
    fixwell::ErrorCode beginPartitionMap(const fixwell::DiskReferencePointer& disk,
                                         Operation operation);
    fixwell::ErrorCode beginPermissions(const fixwell::DiskReferencePointer& disk,
                                        Operation operation);
    fixwell::ErrorCode refusal(const fixwell::DiskReferencePointer& disk,
                               Operation operation) const;
    bool beginPrivileged(const fixwell::DiskReferencePointer& disk, Operation operation);
    void startVolume(JobRequest request);
    void startLive(const fixwell::DiskReferencePointer& disk,
                   const std::vector<MountPlace>& mounts);
    void start(const fixwell::DiskReferencePointer& disk, const ScriptMaker& makeScript);

    fixwell::RunLoop& loop_;
    const Texts& texts_;
    const ManagerOptions& options_;
    fixwell::PLAsyncDelegate& delegate_;
    std::unique_ptr<Job> job_;
};

}  // namespace pellar
