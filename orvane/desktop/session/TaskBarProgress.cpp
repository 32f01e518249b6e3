// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/session/TaskBarProgress.h"

#include <QDBusConnection>
#include <QDBusMessage>
#include <QVariantMap>

#include <utility>

namespace orvane::desktop {

void TaskBarProgress::show(std::optional<double> percent)
{
    const int wanted = percent ? static_cast<int>(*percent) : -1;
    if (std::exchange(shown_, wanted) == wanted)
        return;
    auto bus = bus_();
    if (!bus)
        return;
    QDBusMessage update = QDBusMessage::createSignal(
        QStringLiteral("/org/orvane/Orvane"), QStringLiteral("com.canonical.Unity.LauncherEntry"),
        QStringLiteral("Update"));
    update << QStringLiteral("application://%1.desktop").arg(QString::fromStdString(entry_))
           << QVariantMap{{QStringLiteral("progress"), wanted < 0 ? 0.0 : wanted / 100.0},
                          {QStringLiteral("progress-visible"), wanted >= 0}};
    bus->send(update);
}

}  // namespace orvane::desktop
