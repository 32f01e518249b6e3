// SPDX-License-Identifier: Apache-2.0
#pragma once

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
        // Another test may take the free one first.
        constexpr int mostTries = 20;
        const pellar::FileDescriptor control(::open("/dev/loop-control", O_RDWR | O_CLOEXEC));
        for (int i = 0; control && number_ < 0 && i < mostTries; ++i) {
            number_ = ::ioctl(control.get(), LOOP_CTL_GET_FREE);
            if (!attach(image))
                number_ = -1;
        }
        if (number_ < 0)
            throw std::runtime_error("cannot prepare the test: no loop device");
    }
    LoopDevice(const LoopDevice&) = delete;
    LoopDevice& operator=(const LoopDevice&) = delete;
    ~LoopDevice() { detach(); }

    std::string name() const { return "/dev/loop" + std::to_string(number_); }

    /// NO while somebody else still has the device open from before.
    [[nodiscard]] bool attach(const std::string& image)
    {
        const pellar::FileDescriptor device(::open(name().c_str(), O_RDWR | O_CLOEXEC));
        const pellar::FileDescriptor file(::open(image.c_str(), O_RDWR | O_CLOEXEC));
        isOurs_ = device && file && ::ioctl(device.get(), LOOP_SET_FD, file.get()) == 0;
        return isOurs_;
    }

    /// Somebody else has detached it, and may have given the device to another.
    void forget()
    {
        number_ = -1;
        isOurs_ = false;
    }

    /// Nothing happens when it is detached already: it may be another test's by now.
    void detach()
    {
        if (!std::exchange(isOurs_, false))
            return;
        const pellar::FileDescriptor device(::open(name().c_str(), O_RDWR | O_CLOEXEC));
        if (device)
            ::ioctl(device.get(), LOOP_CLR_FD);
    }

private:
    int number_ = -1;
    bool isOurs_ = false;
};

}  // namespace orvane::test
