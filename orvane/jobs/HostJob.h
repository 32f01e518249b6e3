// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/pellar/PLRepairDisk.h"
#include "orvane/support/SupportHost.h"
#include "pellar/Manager.h"
#include "pellar/RepairDisk.h"

#include <functional>
#include <memory>
#include <string>

namespace orvane {

/// A job that the host begins itself, for what the modules do not know: to undo a repair, or to
/// finish one. What it tells goes to the disk's history, as the rows of a module's job do, and how
/// it ended to the library's observer. Main thread; destroying it ends the job as fast as is safe.
class HostJob final : private contract::PLAsyncDelegate {
public:
    struct Events {
        std::function<void()> rowAdded;                  ///< to the disk's history
        std::function<void(double percent)> progressed;  ///< from 0 to 100
    };

    /// The references outlive it. The disk is kept.
    HostJob(pellar::Manager& library, SupportHost& host, std::shared_ptr<Disk> disk, Events events);
    HostJob(const HostJob&) = delete;
    HostJob& operator=(const HostJob&) = delete;
    ~HostJob() = default;

    /// What such a job is called, with the disk's name.
    static std::string titleOf(pellar::Task task, const Disk& disk, const Translator& texts);

    /// Once. One that cannot begin is over at once, with a row that says why.
    void begin(pellar::Task task);
    bool isOver() const { return isOver_; }
    /// Each further call presses harder.
    void stop() { tool_->cancelCurrentOperation(); }

private:
    void plAsyncStartedForDisk(const contract::DiskReferencePointer& disk) override;
    void plAsyncMessageForDisk(const contract::DiskReferencePointer& disk, std::string_view string,
                               const contract::Dictionary& dictionary) override;
    void plAsyncProgressForDisk(const contract::DiskReferencePointer& disk, bool barberPole,
                                float percent) override;
    void plAsyncFinishedForDisk(const contract::DiskReferencePointer& disk,
                                contract::ErrorCode mainError, contract::ErrorCode detailError,
                                const contract::Dictionary& dictionary) override;
    void add(const contract::Dictionary& record);
    void tellError(contract::ErrorCode error);

    SupportHost& host_;
    const std::shared_ptr<Disk> disk_;
    const Events events_;
    bool isOver_ = false;
    std::unique_ptr<pellar::RepairDisk> tool_;  ///< last: nothing arrives once it is gone
};

}  // namespace orvane
