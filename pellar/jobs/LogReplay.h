// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

namespace pellar {

/// Has the kernel open a file system for writing and close it again, by which it brings what waits
/// in the log to its place. It is mounted nowhere (fsopen(2), without fsmount(2)): no path leads
/// into it, and nothing is left to be unmounted, however the process ends.
///
/// `device` is a block device. 0, or an errno: EPERM without the right to mount, ENODEV when the
/// kernel does not know the file system, others for what is wrong with it.
[[nodiscard]] int replayLog(const std::string& filesystem, int device);

}  // namespace pellar
