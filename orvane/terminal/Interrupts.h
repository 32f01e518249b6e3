// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/loop/MainLoop.h"
#include "orvane/support/loop/SignalReader.h"

#include <functional>

namespace orvane {

/// Calls back on the main thread for each signal that would end the program, from this object's
/// making until its end. No thread may be running when it is made.
class Interrupts {
public:
    /// The loop outlives this object.
    Interrupts(MainLoop& loop, std::function<void()> interrupted);
    Interrupts(const Interrupts&) = delete;
    Interrupts& operator=(const Interrupts&) = delete;
    ~Interrupts();

private:
    SignalReader signals_;
    MainLoop& loop_;
    std::function<void()> interrupted_;
};

}  // namespace orvane
