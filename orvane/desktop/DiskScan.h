// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/loop/EventLoop.h"
#include "orvane/support/udisks/DiskReader.h"

#include <functional>
#include <memory>
#include <thread>
#include <vector>

namespace orvane::desktop {

/// Reads the system's disks in a thread of its own, because a sleeping drive lets its reader wait
/// for seconds. Main thread.
class DiskScan {
public:
    using Finished = std::function<void(const std::vector<DiskTree>& disks)>;

    /// `finished` is called from the loop, which outlives this object.
    DiskScan(EventLoop& loop, Finished finished) : loop_(loop), finished_(std::move(finished)) {}
    DiskScan(const DiskScan&) = delete;
    DiskScan& operator=(const DiskScan&) = delete;
    /// Waits for a scan that is under way; nothing is heard of it any more.
    ~DiskScan();

    /// While a scan is under way, another one follows it: what it has read already may be out of
    /// date. Where the system gives no thread, the scan is done before this returns.
    void start();

private:
    using Liveness = std::shared_ptr<DiskScan*>;

    void finish(const std::vector<DiskTree>& disks);

    EventLoop& loop_;
    Finished finished_;
    bool isScanning_ = false;
    bool mustScanAgain_ = false;
    /// Handed to the task that reports back, which finds it empty when this object has gone.
    Liveness liveness_ = std::make_shared<DiskScan*>(this);
    DiskReader reader_;  ///< the thread's, while there is one
    std::jthread thread_;
};

}  // namespace orvane::desktop
