// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/disks/LoopDevice.h"
#include "pellar/process/FileDescriptor.h"

#include <fcntl.h>
#include <linux/loop.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include <stdexcept>
#include <string>
#include <utility>

namespace orvane::test {

/// A loop device of the kernel over an image file, by loop(4); given back at the end. Needs root.
class LoopDevice {
public:
    /// Why there can be none; null when there can.
    static const char* obstacle()
    {
        if (::geteuid() != 0)
            return "only root can set up a loop device";
        const pellar::FileDescriptor control(::open("/dev/loop-control", O_RDWR | O_CLOEXEC));
        const bool isGiven = control && ::ioctl(control.get(), LOOP_CTL_GET_FREE) >= 0;
        return isGiven && ::access("/sys/block", R_OK) == 0 ? nullptr
                                                            : "the system gives no loop device";
    }

    /// Throws when the system gives none after all.
    explicit LoopDevice(const std::string& image)
    {
        const pellar::FileDescriptor file(::open(image.c_str(), O_RDWR | O_CLOEXEC));
        const auto made = pellar::setUpLoop(file.get(), 0, 0, pellar::Access::ReadWrite,
                                            pellar::LoopLife::UntilDetached);
        if (!made)
            throw std::runtime_error("cannot prepare the test: no loop device");
        name_ = "/dev/" + made->name;
    }
    LoopDevice(const LoopDevice&) = delete;
    LoopDevice& operator=(const LoopDevice&) = delete;
    ~LoopDevice() { detach(); }

    const std::string& name() const { return name_; }

    /// Somebody else has detached it, and may have given the device to another.
    void forget() { isOurs_ = false; }

    /// Nothing happens when it is detached already: it may be another test's by now.
    void detach()
    {
        if (!std::exchange(isOurs_, false))
            return;
        const pellar::FileDescriptor device(::open(name_.c_str(), O_RDWR | O_CLOEXEC));
        if (device)
            ::ioctl(device.get(), LOOP_CLR_FD);
    }

private:
    std::string name_;
    bool isOurs_ = true;
};

}  // namespace orvane::test
