// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/pellar/PLRepairDisk.h"
#include "orvane/support/loop/MainLoop.h"
#include "pellar/jobs/EventQueue.h"

#include <functional>

namespace orvane {

/// Tells whoever asked what happens in the job: a line for each event on standard output.
class Teller final : public contract::PLAsyncDelegate {
public:
    void plAsyncStartedForDisk(const contract::DiskReferencePointer& disk) override;
    void plAsyncMessageForDisk(const contract::DiskReferencePointer& disk, std::string_view string,
                               const contract::Dictionary& dictionary) override;
    void plAsyncProgressForDisk(const contract::DiskReferencePointer&, bool, float) override {}
    void plAsyncFinishedForDisk(const contract::DiskReferencePointer& disk,
                                contract::ErrorCode mainError, contract::ErrorCode detailError,
                                const contract::Dictionary& result) override;

    void trace(std::string_view line);
    bool isOver() const { return isOver_; }

private:
    void tell(const pellar::Event& event);

    bool isOver_ = false;
    bool isHeard_ = true;
};

/// Hears on standard input what is wanted: each "stop" presses once, and so does the end of the
/// input, when nobody is there any more. The loop outlives it.
class StopLine {
public:
    StopLine(MainLoop& loop, std::function<void()> pressed);
    StopLine(const StopLine&) = delete;
    StopLine& operator=(const StopLine&) = delete;
    ~StopLine();

private:
    void read();

    MainLoop& loop_;
    const std::function<void()> pressed_;
};

}  // namespace orvane
