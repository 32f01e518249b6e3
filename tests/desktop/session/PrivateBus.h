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
    ~PrivateBus()
    {
        for (const QString& name : connections_)
            QDBusConnection::disconnectFromBus(name);
    }

    /// NO where no bus can be started (no dbus-daemon).
    bool isRunning() const { return daemon_.isRunning(); }
    /// A connection of its own for each name.
    QDBusConnection connection(const char* name)
    {
        const QString known = QString::fromLatin1(name);
        if (connections_.contains(known))
            return QDBusConnection(known);
        connections_ << known;
        return QDBusConnection::connectToBus(QString::fromStdString(daemon_.address()), known);
    }
    BusLookup lookup(const char* name)
    {
        return [this, name] {
            return std::optional(connection(name));
        };
    }

private:
    orvane::test::BusDaemon daemon_;
    QStringList connections_;
};

}  // namespace orvane::desktop::test
