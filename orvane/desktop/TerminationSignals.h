// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/files/FileDescriptor.h"

#include <QSocketNotifier>

#include <functional>
#include <memory>

namespace orvane::desktop {

/// Turns the signals by which the system ends a program (SIGINT, SIGTERM, SIGHUP) into calls from
/// the event loop. Made before any thread is started: the signals stay blocked in all of them.
class TerminationSignals {
public:
    TerminationSignals();
    TerminationSignals(const TerminationSignals&) = delete;
    TerminationSignals& operator=(const TerminationSignals&) = delete;
    ~TerminationSignals() = default;

    /// From here on, with the application object there, each signal calls `received`.
    void watch(std::function<void()> received);

private:
    void take();

    FileDescriptor descriptor_;
    std::function<void()> received_;
    std::unique_ptr<QSocketNotifier> notifier_;
};

}  // namespace orvane::desktop
