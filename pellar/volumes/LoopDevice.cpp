// SPDX-License-Identifier: Apache-2.0
#include "pellar/volumes/LoopDevice.h"

#include <fcntl.h>
#include <linux/loop.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include <cerrno>
#include <string>

namespace pellar {
namespace {

constexpr std::uint64_t sectorBytes = 512;

loop_config configurationFor(int file, std::uint64_t offset, std::uint64_t length, Access access)
{
    loop_config configuration = {};
    configuration.fd = static_cast<std::uint32_t>(file);
    configuration.info.lo_offset = offset;
    configuration.info.lo_sizelimit = length;
    configuration.info.lo_flags = LO_FLAGS_AUTOCLEAR;
    if (access == Access::ReadOnly)
        configuration.info.lo_flags |= LO_FLAGS_READ_ONLY;
    return configuration;
}

/// A device that is free for the moment; somebody else may be faster.
FileDescriptor openFreeDevice(int control, Access access)
{
    const int number = ::ioctl(control, LOOP_CTL_GET_FREE);
    if (number < 0)
        return {};
    const std::string path = "/dev/loop" + std::to_string(number);
    const int mode = access == Access::ReadOnly ? O_RDONLY : O_RDWR;
    return FileDescriptor(::open(path.c_str(), mode | O_CLOEXEC));
}

}  // namespace

std::variant<LoopDevice, int> LoopDevice::attach(int file, std::uint64_t offset,
                                                 std::uint64_t length, Access access)
{
    if (offset % sectorBytes != 0 || length < sectorBytes)
        return EINVAL;
    const FileDescriptor control(::open("/dev/loop-control", O_RDWR | O_CLOEXEC));
    if (!control)
        return errno;
    constexpr int mostAttempts = 16;
    for (int attempt = 0; attempt < mostAttempts; ++attempt) {
        FileDescriptor device = openFreeDevice(control.get(), access);
        if (!device)
            return errno;
        const loop_config configuration = configurationFor(file, offset, length, access);
        if (::ioctl(device.get(), LOOP_CONFIGURE, &configuration) == 0)
            return LoopDevice(std::move(device));
        if (errno != EBUSY)
            return errno;
    }
    return EBUSY;
}

LoopDevice::~LoopDevice()
{
    if (device_)
        ::fsync(device_.get());
}

}  // namespace pellar
