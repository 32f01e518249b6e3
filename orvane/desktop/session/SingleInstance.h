// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/session/SessionBuses.h"

#include <QDBusConnection>
#include <QObject>
#include <QStringList>
#include <QVariantMap>

#include <functional>
#include <string>
#include <vector>

namespace orvane::desktop {

/// One window for each session: the first program owns the bus name, and those after it hand over
/// what they were to open and end (Desktop Entry Specification 1.5, "D-Bus Activation"). Where
/// there is no bus, or the owner does not answer, each has a window of its own. Main thread.
class SingleInstance final : public QObject {
    Q_OBJECT
    Q_CLASSINFO("D-Bus Interface", "org.freedesktop.Application")

public:
    struct Events {
        /// Somebody wants the window in front.
        std::function<void()> activated;
        /// As orvane/support/DiskLookup.h takes them.
        std::function<void(const std::vector<std::string>& names)> opened;
    };

    /// `entry` is the name of the program's desktop file, without its ending.
    SingleInstance(const BusLookup& bus, const char* entry);
    SingleInstance(const SingleInstance&) = delete;
    SingleInstance& operator=(const SingleInstance&) = delete;
    ~SingleInstance() override;

    /// Whether another program has taken the names; this one is not needed then.
    [[nodiscard]] bool handOver(const std::vector<std::string>& names);
    /// What others ask for from now on; what they have asked before comes at once.
    void setEvents(Events events);

    // The slots of the interface.
public slots:
    Q_SCRIPTABLE void Activate(const QVariantMap& platformData);
    Q_SCRIPTABLE void Open(const QStringList& uris, const QVariantMap& platformData);
    Q_SCRIPTABLE void ActivateAction(const QString& action, const QVariantList& parameters,
                                     const QVariantMap& platformData);

private:
    void tell(std::vector<std::string> names, const QVariantMap& platformData);

    std::optional<QDBusConnection> bus_;
    const QString name_;
    const QString path_;
    bool isOwner_ = false;
    Events events_;
    std::vector<std::string> early_;
};

}  // namespace orvane::desktop
