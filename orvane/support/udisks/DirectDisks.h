// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/udisks/Refusal.h"
#include "pellar/mounts/MountPlace.h"
#include "pellar/process/Access.h"

#include <string>
#include <vector>

namespace orvane {

/// Where the device with this node is mounted, in the order in which it was. Any thread.
[[nodiscard]] std::vector<pellar::MountPlace> placesOf(const std::string& node);

/// Who keeps these places busy, "name (number)", as far as this user may see; printable.
[[nodiscard]] std::string holdersText(const std::vector<pellar::MountPlace>& places);

namespace direct {

// What root does without UDisks2, by libmount and ioctl(2). All take the node of a block device;
// any thread, and may take minutes.

/// YES for root.
[[nodiscard]] bool isAllowed();
/// As /etc/fstab says; NoTable when it does not name the device (fstab(5)).
[[nodiscard]] Result<void, Refusal> mount(const std::string& node);
/// From all the places where it is mounted.
[[nodiscard]] Result<void, Refusal> unmount(const std::string& node);
[[nodiscard]] Result<void, Refusal> eject(const std::string& node);
[[nodiscard]] Result<void, Refusal> detachLoop(const std::string& node);
/// A loop device on an open file that stays; its node.
[[nodiscard]] Result<std::string, Refusal> setUpLoop(int file, pellar::Access access);

}  // namespace direct

}  // namespace orvane
