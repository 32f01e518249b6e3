// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/session/DesktopNotifier.h"

#include <QDBusMessage>
#include <QDBusPendingCallWatcher>
#include <QDBusPendingReply>
#include <QVariantMap>

namespace orvane::desktop {
namespace {

const QString service = QStringLiteral("org.freedesktop.Notifications");
const QString path = QStringLiteral("/org/freedesktop/Notifications");
const QString clickAction = QStringLiteral("default");

// The server decides how long a notice is to be seen.
constexpr int serversChoice = -1;

}  // namespace

void DesktopNotifier::show(const Notice& notice)
{
    auto bus = options_.bus();
    if (!bus)
        return;
    listen(*bus);
    const QString entry = QString::fromStdString(options_.desktopEntry);
    QDBusMessage call =
        QDBusMessage::createMethodCall(service, path, service, QStringLiteral("Notify"));
    call << QStringLiteral("Orvane") << latest_ << entry << QString::fromStdString(notice.title)
         << QString::fromStdString(notice.body)
         << QStringList{clickAction, QString::fromStdString(options_.show)}
         << QVariantMap{{QStringLiteral("desktop-entry"), entry}} << serversChoice;
    auto* const answer = new QDBusPendingCallWatcher(bus->asyncCall(call), this);
    connect(answer, &QDBusPendingCallWatcher::finished, this, [this, answer] {
        const QDBusPendingReply<uint> number = *answer;
        latest_ = number.isError() ? 0 : number.value();
        answer->deleteLater();
    });
}

void DesktopNotifier::listen(QDBusConnection& bus)
{
    if (std::exchange(isListening_, true))
        return;
    bus.connect(service, path, service, QStringLiteral("ActivationToken"), this,
                SLOT(activationToken(uint, QString)));
    bus.connect(service, path, service, QStringLiteral("ActionInvoked"), this,
                SLOT(actionInvoked(uint, QString)));
}

// Comes before the click where the compositor lets only those windows come to the front whose
// program shows that the user wants it; Qt takes the token from there.
void DesktopNotifier::activationToken(uint notice, const QString& token)
{
    if (notice == latest_ && latest_ != 0)
        qputenv("XDG_ACTIVATION_TOKEN", token.toUtf8());
}

void DesktopNotifier::actionInvoked(uint notice, const QString& action)
{
    if (notice == latest_ && latest_ != 0 && action == clickAction && options_.clicked)
        options_.clicked();
}

}  // namespace orvane::desktop
