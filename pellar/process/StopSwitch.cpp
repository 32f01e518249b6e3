// SPDX-License-Identifier: Apache-2.0
#include "pellar/process/StopSwitch.h"

#include <sys/eventfd.h>
#include <unistd.h>

#include <cstdint>

namespace pellar {

StopSwitch::StopSwitch() : event_(::eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK)) {}

void StopSwitch::press() noexcept
{
    presses_.fetch_add(1, std::memory_order_acq_rel);
    wake();
}

void StopSwitch::pressHard() noexcept
{
    isHard_.store(true, std::memory_order_release);
    wake();
}

// A failed write means that the counter is full and the descriptor readable: nothing is lost.
void StopSwitch::wake() noexcept
{
    const std::uint64_t one = 1;
    [[maybe_unused]] const auto written = ::write(event_.get(), &one, sizeof one);
}

void StopSwitch::rest() noexcept
{
    std::uint64_t count = 0;
    [[maybe_unused]] const auto read = ::read(event_.get(), &count, sizeof count);
}

}  // namespace pellar
