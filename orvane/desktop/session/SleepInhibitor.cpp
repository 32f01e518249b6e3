// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/session/SleepInhibitor.h"

#include <QDBusMessage>
#include <QDBusPendingCallWatcher>
#include <QDBusPendingReply>

namespace orvane::desktop {

void SleepInhibitor::hold(const std::string& reason)
{
    const auto bus = bus_();
    if (!bus)
        return;
    QDBusMessage call = QDBusMessage::createMethodCall(
        QStringLiteral("org.freedesktop.login1"), QStringLiteral("/org/freedesktop/login1"),
        QStringLiteral("org.freedesktop.login1.Manager"), QStringLiteral("Inhibit"));
    call << QStringLiteral("sleep:shutdown:idle") << QStringLiteral("Orvane")
         << QString::fromStdString(reason) << QStringLiteral("block");
    auto* const answer = new QDBusPendingCallWatcher(bus->asyncCall(call), this);
    connect(answer, &QDBusPendingCallWatcher::finished, this, [this, answer, wish = ++latest_] {
        const QDBusPendingReply<QDBusUnixFileDescriptor> lock = *answer;
        if (wish == latest_ && !lock.isError())
            lock_ = lock.value();
        answer->deleteLater();
    });
}

void SleepInhibitor::release()
{
    ++latest_;
    lock_ = {};
}

}  // namespace orvane::desktop
