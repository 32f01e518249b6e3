// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/mounts/MountTable.h"

#include <chrono>
#include <optional>
#include <string_view>
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

}  // namespace orvane
