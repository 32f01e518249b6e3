// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/process/Command.h"
#include "pellar/process/FileDescriptor.h"

#include <atomic>
#include <chrono>
#include <optional>

namespace pellar {

using Clock = std::chrono::steady_clock;

/// How long a tool may take over each way of being asked to end.
struct GraceTimes {
    std::chrono::milliseconds afterInterrupt;
    std::chrono::milliseconds afterTerminate;
    /// After SIGINT, when the program is leaving; 0 kills at once.
    std::chrono::milliseconds atLeaving;
};

/// A tool that writes gets time to leave the disk sound; one that only reads gets little.
GraceTimes graceTimesFor(Access access);
/// For a tool that would leave the disk half written: only being asked three times ends it, or the
/// program's leaving after a long wait.
GraceTimes graceTimesOfUnstoppable();

/// Which signal ends a tool at which time: SIGINT, then SIGTERM, then SIGKILL. Pure: it is told
/// the time and answers the signal that is to be sent now, or 0.
class StopLadder {
public:
    explicit StopLadder(GraceTimes times) : times_(times) {}

    /// The next step, at once.
    int press(Clock::time_point now);
    /// Skips what is between SIGINT and SIGKILL and waits no longer than `atLeaving`.
    int pressHard(Clock::time_point now);
    /// To be asked when `deadline` has passed.
    int due(Clock::time_point now);

    bool isStopping() const { return step_ != Step::None; }
    /// None when nothing is to happen by itself.
    std::optional<Clock::time_point> deadline() const { return deadline_; }

private:
    enum class Step { None, Interrupt, Terminate, Kill };

    int enter(Step step, Clock::time_point now);

    GraceTimes times_;
    Step step_ = Step::None;
    bool isLeaving_ = false;
    std::optional<Clock::time_point> deadline_;
};

/// By which one thread asks another to stop a job. Any thread.
class StopSwitch {
public:
    StopSwitch();

    /// Each further press asks for a harder way.
    void press() noexcept;
    /// The program is leaving and cannot wait for long.
    void pressHard() noexcept;

    bool isPressed() const noexcept { return presses() > 0 || isHard(); }
    unsigned presses() const noexcept { return presses_.load(std::memory_order_acquire); }
    bool isHard() const noexcept { return isHard_.load(std::memory_order_acquire); }

    /// Readable after a press until `rest` is called; for poll(2).
    int descriptor() const noexcept { return event_.get(); }
    void rest() noexcept;

private:
    void wake() noexcept;

    FileDescriptor event_;
    std::atomic<unsigned> presses_ = 0;
    std::atomic<bool> isHard_ = false;
};

}  // namespace pellar
