// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/loop/MainLoop.h"

#include <functional>

namespace orvane {

/// Turns the signals by which a user or the system ends a program (SIGINT, SIGTERM, SIGHUP) into
/// calls on the main thread, from this object's making until its end. Made before any thread is
/// started: the signals stay blocked in all of them.
class Interrupts {
public:
    /// The loop outlives this object.
    Interrupts(MainLoop& loop, std::function<void()> interrupted);
    Interrupts(const Interrupts&) = delete;
    Interrupts& operator=(const Interrupts&) = delete;
    ~Interrupts();

private:
    void take();

    MainLoop& loop_;
    std::function<void()> interrupted_;
    FileDescriptor descriptor_;
};

}  // namespace orvane
