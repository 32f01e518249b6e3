// SPDX-License-Identifier: Apache-2.0
#include "pellar/jobs/LogReplay.h"

#include "pellar/process/FileDescriptor.h"

#include <sys/mount.h>

#include <cerrno>

namespace pellar {

int replayLog(const std::string& filesystem, int device)
{
    const FileDescriptor context(::fsopen(filesystem.c_str(), FSOPEN_CLOEXEC));
    if (!context)
        return errno;
    const std::string source = pathOfDescriptor(device);
    if (::fsconfig(context.get(), FSCONFIG_SET_STRING, "source", source.c_str(), 0) != 0)
        return errno;
    // A copy of a volume has its UUID, and the volume itself may be mounted (xfs(5)).
    if (filesystem == "xfs" &&
        ::fsconfig(context.get(), FSCONFIG_SET_FLAG, "nouuid", nullptr, 0) != 0)
        return errno;
    return ::fsconfig(context.get(), FSCONFIG_CMD_CREATE, nullptr, nullptr, 0) == 0 ? 0 : errno;
}

}  // namespace pellar
