// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/disks/Disk.h"

#include <chrono>
#include <optional>
#include <stop_token>
#include <string>
#include <string_view>
#include <vector>

namespace orvane {

/// A timer of scheduled checks (fixwell-check@.timer) that is waiting.
struct CheckTimer {
    std::string disk;  ///< as DiskLookup takes it, or "all"
    std::chrono::system_clock::time_point next;

    friend bool operator==(const CheckTimer&, const CheckTimer&) = default;
};

/// What the instance of a unit stands for: systemd-escape(1) undone. A path may be escaped with or
/// without its first slash: "dev-sdb1" and "-dev-sdb1" are /dev/sdb1. What is no escape stays.
[[nodiscard]] std::string nameOfInstance(std::string_view instance);

/// Asks the service manager (org.freedesktop.systemd1(5)); nothing where there is none, or it has
/// not answered after two seconds, or the thread is asked to stop. Any thread; not one that draws.
[[nodiscard]] std::vector<CheckTimer> readCheckTimers(const std::stop_token& stop = {});

/// When the disk is checked next; none where no timer is about it, or the check would skip it as it
/// is now: what cannot be verified, or is mounted and cannot be verified there. Main thread.
[[nodiscard]] std::optional<std::chrono::system_clock::time_point> nextCheckOf(
    const Disk& disk, const std::vector<CheckTimer>& timers);

}  // namespace orvane
