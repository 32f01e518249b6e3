// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/jobs/JobObserver.h"

#include <memory>

namespace orvane {

/// Stands between a module and the disk-management library, passes everything on unchanged, and
/// tells an observer about the jobs. Main thread only.
class ObservedManager final : public contract::PLManager, private contract::PLAsyncDelegate {
public:
    /// Both outlive this object.
    ObservedManager(contract::PLManager& library, JobObserver& observer);

    void setDelegate(contract::PLAsyncDelegate* delegate) override;
    std::unique_ptr<contract::PLRepairDisk> makeRepairDisk() override;

    /// Presses the running job harder to end; nothing happens when none runs.
    void cancelAgain();

private:
    class ObservedRepairDisk;

    void plAsyncStartedForDisk(const contract::DiskReferencePointer& disk) override;
    void plAsyncMessageForDisk(const contract::DiskReferencePointer& disk, std::string_view string,
                               const contract::Dictionary& dictionary) override;
    void plAsyncProgressForDisk(const contract::DiskReferencePointer& disk, bool barberPole,
                                float percent) override;
    void plAsyncFinishedForDisk(const contract::DiskReferencePointer& disk,
                                contract::ErrorCode mainError, contract::ErrorCode detailError,
                                const contract::Dictionary& dictionary) override;

    contract::PLManager& library_;
    JobObserver& observer_;
    contract::PLAsyncDelegate* module_ = nullptr;
    ObservedRepairDisk* latest_ = nullptr;  ///< not owned; forgets itself when it goes
};

}  // namespace orvane
