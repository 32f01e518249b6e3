// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/process/KernelFiles.h"

#include <sys/types.h>

#include <string>
#include <string_view>

namespace pellar {

/// Whether a line-wise list in the format of /proc/self/mountinfo (proc(5)) names the device:
/// "36 35 98:0 /mnt1 /mnt2 rw,noatime master:1 - ext3 /dev/root rw,errors=continue".
bool mountInfoNames(std::string_view mountInfo, unsigned major, unsigned minor);

/// Whether a file system on this block device is mounted. YES also when the list cannot be read:
/// what is not known to be free is not touched.
bool isMounted(dev_t device, const SystemPaths& paths);

}  // namespace pellar
