// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/loop/SignalReader.h"

#include <QSocketNotifier>

#include <functional>
#include <memory>

namespace orvane::desktop {

/// Calls back from the event loop for each signal that would end the program. Made before any
/// thread is started.
class TerminationSignals {
public:
    /// From here on, with the application object there, each signal calls `received`.
    void watch(std::function<void()> received);

private:
    SignalReader signals_;
    std::unique_ptr<QSocketNotifier> notifier_;
};

}  // namespace orvane::desktop
