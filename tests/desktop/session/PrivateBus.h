// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/session/SessionBuses.h"
#include "tests/support/BusDaemon.h"

#include <QDBusConnection>

namespace orvane::desktop::test {

/// A bus of the test's own, on which nothing is started by itself; it ends with this object.
class PrivateBus {
public:
    PrivateBus() = default;
    PrivateBus(const PrivateBus&) = delete;
    PrivateBus& operator=(const PrivateBus&) = delete;
    ~PrivateBus();

    /// NO where no bus can be started (no dbus-daemon).
    bool isRunning() const { return daemon_.isRunning(); }
    /// A connection of its own for each name.
    QDBusConnection connection(const char* name);
    BusLookup lookup(const char* name);

private:
    orvane::test::BusDaemon daemon_;
    QStringList connections_;
};

}  // namespace orvane::desktop::test
