// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/RunLoop.h"
#include "contract/pellar/PLRepairDisk.h"
#include "pellar/jobs/Job.h"
#include "pellar/jobs/VolumeScript.h"
#include "pellar/outcome/Task.h"
#include "pellar/texts/Texts.h"

#include <memory>
#include <vector>

namespace pellar {

/// The library's tool of one module. The references, and the delegate, outlive it.
class RepairDisk final : public contract::PLRepairDisk {
public:
    RepairDisk(contract::RunLoop& loop, const Texts& texts, const JobOptions& options,
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

    /// As the six above, and as they answer; of the tasks that a module does not know as well.
    contract::ErrorCode begin(Task task, const contract::DiskReferencePointer& disk);

    /// Points here as long as the tool is there.
    std::weak_ptr<RepairDisk*> liveness() const { return self_; }

private:
    contract::ErrorCode beginUnobserved(Task task, const contract::DiskReferencePointer& disk);
    contract::ErrorCode refusal(Task task, const contract::DiskReferencePointer& disk) const;
    contract::ErrorCode refusalOfPermissions(const contract::DiskReference& disk) const;
    bool beginPrivileged(Task task, const contract::DiskReferencePointer& disk);
    contract::ErrorCode beginVolume(const contract::DiskReferencePointer& disk,
                                    Operation operation);
    contract::ErrorCode beginUndo(Task task, const contract::DiskReferencePointer& disk);
    contract::ErrorCode beginMounted(const contract::DiskReferencePointer& disk,
                                     Operation operation, contract::ErrorCode error);
    bool isPartThatOthersAttach(const VolumeRequest& request) const;
    void traceTool(const contract::DiskReference& disk, Operation operation) const;
    void trace(const std::string& line) const;
    JobContext context(const contract::DiskReference& disk, StopSwitch& stop,
                       EventQueue& events) const;
    template <class JobScript, class Argument>
    void startScript(const contract::DiskReferencePointer& disk, const Argument& argument);
    void startVolume(VolumeRequest request);
    void start(const contract::DiskReferencePointer& disk, const ScriptMaker& makeScript);

    contract::RunLoop& loop_;
    const Texts& texts_;
    const JobOptions& options_;
    contract::PLAsyncDelegate& delegate_;
    std::unique_ptr<Job> job_;
    const std::shared_ptr<RepairDisk*> self_ = std::make_shared<RepairDisk*>(this);
};

}  // namespace pellar
