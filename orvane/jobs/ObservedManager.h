// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/jobs/JobObserver.h"

#include <memory>

namespace orvane {

/// Stands between a module and the disk-management library, passes everything on unchanged, and
/// tells an observer about the jobs. Main thread only.
class ObservedManager final : public fixwell::PLManager, private fixwell::PLAsyncDelegate {
public:
    /// Both outlive this object.
    ObservedManager(fixwell::PLManager& library, JobObserver& observer);

    void setDelegate(fixwell::PLAsyncDelegate* delegate) override;
    std::unique_ptr<fixwell::PLRepairDisk> makeRepairDisk() override;

    /// Presses the running job harder to end; nothing happens when none runs.
    void cancelAgain();

private:
    class ObservedRepairDisk;

    void plAsyncStartedForDisk(const fixwell::DiskReferencePointer& disk) override;
    void plAsyncMessageForDisk(const fixwell::DiskReferencePointer& disk, std::string_view string,
                               const fixwell::Dictionary& dictionary) override;
    void plAsyncProgressForDisk(const fixwell::DiskReferencePointer& disk, bool barberPole,
                                float percent) override;
    void plAsyncFinishedForDisk(const fixwell::DiskReferencePointer& disk,
                                fixwell::ErrorCode mainError, fixwell::ErrorCode detailError,
                                const fixwell::Dictionary& dictionary) override;

    fixwell::PLManager& library_;
    JobObserver& observer_;
    fixwell::PLAsyncDelegate* module_ = nullptr;
    ObservedRepairDisk* latest_ = nullptr;  ///< not owned; forgets itself when it goes
};

}  // namespace orvane
