// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <libmount/libmount.h>

#include <cerrno>
#include <memory>

namespace pellar {

struct FreeMountContext {
    void operator()(libmnt_context* context) const { mnt_free_context(context); }
};

/// One mount or unmount by libmount; null when there is no memory.
using MountContext = std::unique_ptr<libmnt_context, FreeMountContext>;

/// What libmount's answer to it means: 0, or an errno value. The library answers its own failures
/// negative, and a system call's with a status of its own (libmount's documentation, "Mount
/// context"). A helper, such as that of NTFS-3G, has neither and told its own standard error: EIO.
[[nodiscard]] inline int errorOf(const MountContext& context, int answer)
{
    const bool hasHelperFailed = mnt_context_helper_executed(context.get()) == 1 &&
                                 mnt_context_get_helper_status(context.get()) != 0;
    if (answer == 0)
        return hasHelperFailed ? EIO : 0;
    const int error = mnt_context_get_syscall_errno(context.get());
    return error != 0 ? error : answer < 0 ? -answer : EINVAL;
}

}  // namespace pellar
