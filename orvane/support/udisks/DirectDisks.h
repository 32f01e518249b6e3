// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/udisks/Refusal.h"
#include "pellar/process/Command.h"

#include <string>

namespace orvane::direct {

// What root does without UDisks2, by libmount and ioctl(2). All take the node of a block device;
// any thread, and may take minutes.

/// YES for root.
[[nodiscard]] bool isAllowed();
/// As /etc/fstab says; NoTable when it does not name the device (fstab(5)).
[[nodiscard]] Answer<> mount(const std::string& node);
/// From all the places where it is mounted.
[[nodiscard]] Answer<> unmount(const std::string& node);
[[nodiscard]] Answer<> eject(const std::string& node);
[[nodiscard]] Answer<> detachLoop(const std::string& node);
/// A loop device on an open file that stays; its node.
[[nodiscard]] Answer<std::string> setUpLoop(int file, pellar::Access access);

}  // namespace orvane::direct
