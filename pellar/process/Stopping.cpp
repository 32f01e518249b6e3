// SPDX-License-Identifier: Apache-2.0
#include "pellar/process/Stopping.h"

#include <sys/eventfd.h>
#include <unistd.h>

#include <algorithm>
#include <csignal>
#include <cstdint>

namespace pellar {

using namespace std::chrono_literals;

GraceTimes graceTimesFor(Access access)
{
    return access == Access::ReadOnly ? GraceTimes{2s, 2s, 0s} : GraceTimes{10s, 10s, 3s};
}

GraceTimes graceTimesOfUnstoppable()
{
    return {24h, 24h, 30s};
}

int StopLadder::press(Clock::time_point now)
{
    switch (step_) {
        case Step::None: return enter(Step::Interrupt, now);
        case Step::Interrupt: return enter(isLeaving_ ? Step::Kill : Step::Terminate, now);
        case Step::Terminate: return enter(Step::Kill, now);
        case Step::Kill: break;
    }
    return 0;
}

int StopLadder::pressHard(Clock::time_point now)
{
    if (isLeaving_ || step_ == Step::Kill)
        return 0;
    isLeaving_ = true;
    if (times_.atLeaving == 0ms)
        return enter(Step::Kill, now);
    const int signal = isStopping() ? 0 : enter(Step::Interrupt, now);
    deadline_ = std::min(deadline_.value_or(now + times_.atLeaving), now + times_.atLeaving);
    return signal;
}

int StopLadder::due(Clock::time_point now)
{
    if (!deadline_ || now < *deadline_)
        return 0;
    return isLeaving_ ? enter(Step::Kill, now) : press(now);
}

int StopLadder::enter(Step step, Clock::time_point now)
{
    step_ = step;
    switch (step) {
        case Step::Interrupt: deadline_ = now + times_.afterInterrupt; return SIGINT;
        case Step::Terminate: deadline_ = now + times_.afterTerminate; return SIGTERM;
        case Step::Kill: deadline_.reset(); return SIGKILL;
        case Step::None: break;
    }
    return 0;
}

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
