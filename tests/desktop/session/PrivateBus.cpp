// SPDX-License-Identifier: Apache-2.0
#include "tests/desktop/session/PrivateBus.h"

namespace orvane::desktop::test {

PrivateBus::~PrivateBus()
{
    for (const QString& name : connections_)
        QDBusConnection::disconnectFromBus(name);
}

QDBusConnection PrivateBus::connection(const char* name)
{
    const QString known = QString::fromLatin1(name);
    if (connections_.contains(known))
        return QDBusConnection(known);
    connections_ << known;
    return QDBusConnection::connectToBus(QString::fromStdString(daemon_.address()), known);
}

BusLookup PrivateBus::lookup(const char* name)
{
    return [this, name] {
        return std::optional(connection(name));
    };
}

}  // namespace orvane::desktop::test
