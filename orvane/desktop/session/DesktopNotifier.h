// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/session/JobNotice.h"
#include "orvane/desktop/session/SessionBuses.h"

#include <QObject>
#include <QString>

#include <functional>
#include <string>

namespace orvane::desktop {

/// Shows notices through the desktop's notification server (Desktop Notifications Specification
/// 1.2). Where there is none, nothing happens. Nothing here waits for the server. Main thread.
class DesktopNotifier final : public QObject {
    Q_OBJECT

public:
    struct Options {
        BusLookup bus;
        std::string desktopEntry;   ///< the name of the program's desktop file, and of its icon
        std::string show = "Show";  ///< what a click does, for servers that show it as a button
        std::function<void()> clicked;
    };

    explicit DesktopNotifier(Options options) : options_(std::move(options)) {}

    /// Takes the place of the notice before.
    void show(const Notice& notice);

private slots:
    void actionInvoked(uint notice, const QString& action);
    void activationToken(uint notice, const QString& token);

private:
    void listen(QDBusConnection& bus);

    const Options options_;
    uint latest_ = 0;  ///< the server's number; 0 while it has given none
    bool isListening_ = false;
};

}  // namespace orvane::desktop
