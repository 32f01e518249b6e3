// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/Failure.h"
#include "orvane/support/files/FileDescriptor.h"
#include "orvane/support/loop/HostLoop.h"
#include "pellar/process/Stopping.h"

#include <functional>
#include <memory>
#include <thread>

namespace orvane {

/// Tells when disks may have come, gone or changed, or were mounted or unmounted. Needs no
/// privileges and no daemon. Main thread.
class DiskWatch {
public:
    /// `changed` is called from the loop, once for each burst of events; the loop outlives this
    /// object.
    DiskWatch(HostLoop& loop, std::function<void()> changed);
    DiskWatch(const DiskWatch&) = delete;
    DiskWatch& operator=(const DiskWatch&) = delete;
    /// `changed` is not called any more.
    ~DiskWatch();

    /// Once. What happened before goes unnoticed, so look at the disks after this. Where the
    /// system does not let the program listen to the kernel (some containers), that is answered,
    /// and mounts are watched all the same.
    [[nodiscard]] Outcome<> start();

private:
    using Liveness = std::shared_ptr<DiskWatch*>;

    class Watcher;

    HostLoop& loop_;
    const std::function<void()> changed_;
    /// Handed to the tasks that report, which find it empty when this object has gone.
    Liveness liveness_ = std::make_shared<DiskWatch*>(this);
    pellar::StopSwitch stop_;
    std::jthread thread_;
};

}  // namespace orvane
