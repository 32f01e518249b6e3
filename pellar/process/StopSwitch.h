// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/process/FileDescriptor.h"

#include <atomic>

namespace pellar {

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
