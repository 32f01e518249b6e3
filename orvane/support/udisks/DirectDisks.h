// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/udisks/Refusal.h"
#include "pellar/mounts/MountTable.h"
#include "pellar/process/Command.h"

#include <string>
#include <vector>

namespace orvane {

/// Where the device with this node is mounted, in the order in which it was. Any thread.
[[nodiscard]] std::vector<pellar::Mount> placesOf(const std::string& node);

/// What root does without UDisks2, by libmount and ioctl(2). All take the node of a block device;
/// any thread, and may take minutes.
struct DirectDisks {
    /// YES for root.
    [[nodiscard]] static bool isAllowed();
    /// As /etc/fstab says; NoTable when it does not name the device (fstab(5)).
    [[nodiscard]] static Result<void, Refusal> mount(const std::string& node);
    /// From all the places where it is mounted.
    [[nodiscard]] static Result<void, Refusal> unmount(const std::string& node);
    [[nodiscard]] static Result<void, Refusal> eject(const std::string& node);
    [[nodiscard]] static Result<void, Refusal> detachLoop(const std::string& node);
    /// A loop device on an open file that stays; its node.
    [[nodiscard]] static Result<std::string, Refusal> setUpLoop(int file, pellar::Access access);
};

}  // namespace orvane
