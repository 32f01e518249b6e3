// SPDX-License-Identifier: Apache-2.0
#include "pellar/disks/LoopDevice.h"

#include <fcntl.h>
#include <linux/loop.h>
#include <sys/ioctl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <thread>

namespace pellar {
namespace {

using namespace std::chrono_literals;

constexpr std::uint64_t sectorBytes = 512;

loop_config configurationFor(int file, std::uint64_t offset, std::uint64_t length, Access access,
                             LoopLife life)
{
    loop_config configuration = {};
    configuration.fd = static_cast<std::uint32_t>(file);
    configuration.info.lo_offset = offset;
    configuration.info.lo_sizelimit = length;
    configuration.info.lo_flags =
        life == LoopLife::UntilClosed ? LO_FLAGS_AUTOCLEAR : LO_FLAGS_PARTSCAN;
    if (access == Access::ReadOnly)
        configuration.info.lo_flags |= LO_FLAGS_READ_ONLY;
    return configuration;
}

FileDescriptor openDevice(const std::string& name, Access access)
{
    const int mode = access == Access::ReadOnly ? O_RDONLY : O_RDWR;
    return FileDescriptor(::open(("/dev/" + name).c_str(), mode | O_CLOEXEC));
}

bool isSameFile(const std::string& path, dev_t device, ino_t number)
{
    struct stat status = {};
    return ::stat(path.c_str(), &status) == 0 && status.st_dev == device && status.st_ino == number;
}

}  // namespace

Result<NewLoopDevice, int> setUpLoop(int file, std::uint64_t offset, std::uint64_t length,
                                     Access access, LoopLife life)
{
    if (offset % sectorBytes != 0)
        return EINVAL;
    const FileDescriptor control(::open("/dev/loop-control", O_RDWR | O_CLOEXEC));
    if (!control)
        return errno;
    constexpr int mostAttempts = 16;
    for (int attempt = 0; attempt < mostAttempts; ++attempt) {
        // Free for the moment; somebody else may be faster.
        const int number = ::ioctl(control.get(), LOOP_CTL_GET_FREE);
        if (number < 0)
            return errno;
        const std::string name = "loop" + std::to_string(number);
        FileDescriptor device = openDevice(name, access);
        if (!device)
            return errno;
        const loop_config configuration = configurationFor(file, offset, length, access, life);
        if (::ioctl(device.get(), LOOP_CONFIGURE, &configuration) == 0)
            return NewLoopDevice{std::move(device), name};
        if (errno != EBUSY)
            return errno;
    }
    return EBUSY;
}

Result<LoopDevice, int> LoopDevice::attach(int file, std::uint64_t offset, std::uint64_t length,
                                           Access access)
{
    if (length < sectorBytes)
        return EINVAL;
    auto made = setUpLoop(file, offset, length, access, LoopLife::UntilClosed);
    if (!made)
        return made.error();
    auto& [device, name] = *made;
    return LoopDevice(std::move(device), name);
}

LoopDevice::LoopDevice(FileDescriptor device, const std::string& name)
    : device_(std::move(device)),
      node_("/dev/" + name),
      place_("/sys/block/" + name + "/loop/backing_file"),
      behind_(readKernelFile(place_))
{
}

LoopDevice::~LoopDevice()
{
    if (!device_)
        return;
    ::fsync(device_.get());
    device_.reset();
    for (int i = 0; i < 100 && behind_ && readKernelFile(place_) == behind_; ++i)
        std::this_thread::sleep_for(10ms);
}

std::string loopDeviceOn(dev_t fileDevice, ino_t fileNumber, const SystemPaths& paths)
{
    std::error_code error;
    for (const auto& device : std::filesystem::directory_iterator(paths.blockDevices, error)) {
        // sysfs ends every value with a line feed; the path itself may hold one.
        std::optional<std::string> file = readKernelFile(device.path() / "loop/backing_file");
        if (!file || file->empty())
            continue;
        if (file->back() == '\n')
            file->pop_back();
        if (isSameFile(*file, fileDevice, fileNumber))
            return "/dev/" + device.path().filename().native();
    }
    return {};
}

}  // namespace pellar
