// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/session/SessionBuses.h"
#include "tests/support/TemporaryDirectory.h"

#include <QDBusConnection>

#include <sys/types.h>

#include <string>

namespace orvane::desktop::test {

/// A bus of the test's own, on which nothing is started by itself; it ends with this object.
class PrivateBus {
public:
    PrivateBus();
    PrivateBus(const PrivateBus&) = delete;
    PrivateBus& operator=(const PrivateBus&) = delete;
    ~PrivateBus();

    /// NO where no bus can be started (no dbus-daemon).
    bool isRunning() const { return !address_.empty(); }
    /// A connection of its own for each name.
    QDBusConnection connection(const char* name);
    BusLookup lookup(const char* name);

private:
    const orvane::test::TemporaryDirectory directory_;
    pid_t daemon_ = 0;
    std::string address_;
    QStringList connections_;
};

}  // namespace orvane::desktop::test
