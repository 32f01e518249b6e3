// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/files/Failure.h"
#include "orvane/support/loop/EventLoop.h"
#include "pellar/mounts/MountTable.h"
#include "pellar/process/FileDescriptor.h"
#include "pellar/process/Stopping.h"

#include <chrono>
#include <functional>
#include <memory>
#include <optional>
#include <string_view>
#include <thread>
#include <vector>

namespace orvane {

/// Whether a message of the kernel or of udevd (netlink(7), NETLINK_KOBJECT_UEVENT) is about a
/// block device. Any bytes.
[[nodiscard]] bool isAboutBlockDevice(std::string_view message);

/// The mounts that have a device behind them. Containers come and go with dozens of others.
[[nodiscard]] std::vector<pellar::Mount> deviceMounts(const std::vector<pellar::Mount>& mounts);

/// Joins events that come in bursts: one stick that is plugged in makes a dozen. They are due when
/// it has been quiet for a while, or when the first has waited long enough.
class EventBurst {
public:
    using Clock = std::chrono::steady_clock;

    void note(Clock::time_point now);
    /// How long until the events are due; none when there are none.
    [[nodiscard]] std::optional<std::chrono::milliseconds> timeLeft(Clock::time_point now) const;
    /// YES, once, when events are due.
    [[nodiscard]] bool takeDue(Clock::time_point now);

private:
    struct Span {
        Clock::time_point first;
        Clock::time_point last;
    };

    std::optional<Span> events_;
};

/// Tells when disks may have come, gone or changed, or were mounted or unmounted. Needs no
/// privileges and no daemon. Main thread.
class DiskWatch {
public:
    /// `changed` is called from the loop, once for each burst of events; the loop outlives this
    /// object.
    DiskWatch(EventLoop& loop, std::function<void()> changed);
    DiskWatch(const DiskWatch&) = delete;
    DiskWatch& operator=(const DiskWatch&) = delete;
    /// `changed` is not called any more.
    ~DiskWatch();

    /// Once. What happened before goes unnoticed, so look at the disks after this. Where the
    /// system does not let the program listen to the kernel (some containers), that is answered,
    /// and mounts are watched all the same.
    [[nodiscard]] Result<void, Failure> start();

private:
    using Liveness = std::shared_ptr<DiskWatch*>;

    class Watcher;

    EventLoop& loop_;
    const std::function<void()> changed_;
    /// Handed to the tasks that report, which find it empty when this object has gone.
    Liveness liveness_ = std::make_shared<DiskWatch*>(this);
    pellar::StopSwitch stop_;
    std::jthread thread_;
};

}  // namespace orvane
