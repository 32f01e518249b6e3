// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/outcome/Result.h"
#include "pellar/process/FileDescriptor.h"

namespace pellar {

/// A file system that this process serves, mounted nowhere: it has no place in any directory, and
/// is gone with its last descriptor, however the process ends.
struct FuseMount {
    FileDescriptor channel;  ///< of /dev/fuse (fuse(4))
    FileDescriptor root;     ///< for openat(2)
};

/// As root in the namespaces of this process; for others in a user namespace of its own, of which
/// nothing but the mount is left (user_namespaces(7)). What is mounted is its user's alone. An
/// errno where neither is to be had: ENOENT without /dev/fuse, EPERM where user namespaces are
/// not for everybody. Any thread.
[[nodiscard]] Result<FuseMount, int> mountDetached();

}  // namespace pellar
