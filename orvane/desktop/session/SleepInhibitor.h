// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/session/SessionBuses.h"

#include <QDBusUnixFileDescriptor>
#include <QObject>

#include <cstdint>
#include <string>

namespace orvane::desktop {

/// Keeps the machine awake while a disk is written to, by a lock of logind's
/// (org.freedesktop.login1(5), Inhibit): no sleep, no shutdown, no idle action. Nothing waits for
/// the answer; without logind, or where it refuses, nothing happens. Main thread.
class SleepInhibitor final : public QObject {
    Q_OBJECT

public:
    /// `bus` is the system bus.
    explicit SleepInhibitor(BusLookup bus) : bus_(std::move(bus)) {}

    /// Asks for the lock. `reason` is shown to a user who wants to sleep or shut down. A lock that
    /// is held is given back once the new one is there.
    void hold(const std::string& reason);
    /// Gives the lock back, also one that has not arrived yet.
    void release();
    bool isHeld() const { return lock_.isValid(); }

private:
    BusLookup bus_;
    std::uint64_t latest_ = 0;      ///< counts the wishes; answers to older ones are dropped
    QDBusUnixFileDescriptor lock_;  ///< logind gives the lock back when it is closed
};

}  // namespace orvane::desktop
