// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/loop/MainLoop.h"

#include <csignal>
#include <functional>

namespace orvane {

/// Turns the signals by which a user or the system ends a program (SIGINT, SIGTERM, SIGHUP) into
/// calls on the main thread, from this object's making until its end. Threads that are started
/// meanwhile leave the signals alone; none may be running before.
class Interrupts {
public:
    /// The loop outlives this object.
    Interrupts(MainLoop& loop, std::function<void()> interrupted);
    Interrupts(const Interrupts&) = delete;
    Interrupts& operator=(const Interrupts&) = delete;
    ~Interrupts();

private:
    void take();

    sigset_t before_{};
    MainLoop& loop_;
    std::function<void()> interrupted_;
    FileDescriptor descriptor_;
};

}  // namespace orvane
