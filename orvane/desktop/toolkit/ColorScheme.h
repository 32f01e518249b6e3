// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QDBusConnection>
#include <QDBusVariant>
#include <QObject>
#include <QPalette>

namespace orvane::desktop {

/// Light text on dark ground, for the style "Fusion".
[[nodiscard]] QPalette darkPalette();

/// Makes the program dark, and light again, as the user's desktop asks for it. Qt's own theme for
/// the desktop does that, or it does not (Qt 6.4 on GNOME does not); only then this object acts.
/// Asks the settings portal (org.freedesktop.portal.Settings, xdg-desktop-portal 1.14), and does
/// not wait for the answer. Main thread, with the application object there.
class ColorScheme final : public QObject {
    Q_OBJECT

public:
    explicit ColorScheme(QDBusConnection bus);

private slots:
    void settingChanged(const QString& group, const QString& key, const QDBusVariant& value);

private:
    void ask(QDBusConnection& bus);
    void adopt(uint preference);

    bool isDark_ = false;  ///< because of this object
};

}  // namespace orvane::desktop
