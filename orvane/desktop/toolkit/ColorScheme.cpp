// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/ColorScheme.h"

#include <QApplication>
#include <QDBusMessage>
#include <QDBusPendingCallWatcher>
#include <QDBusPendingReply>
#include <QStyle>

namespace orvane::desktop {
namespace {

const QString service = QStringLiteral("org.freedesktop.portal.Desktop");
const QString path = QStringLiteral("/org/freedesktop/portal/desktop");
const QString interface = QStringLiteral("org.freedesktop.portal.Settings");
const QString appearance = QStringLiteral("org.freedesktop.appearance");
const QString colorScheme = QStringLiteral("color-scheme");

constexpr uint prefersDark = 1;  // 0 is no preference, 2 is light

bool isLight(const QPalette& palette)
{
    return palette.color(QPalette::Window).lightness() >
           palette.color(QPalette::WindowText).lightness();
}

// Other styles have colours of their own.
bool canBeDyed()
{
    return QApplication::style()->name() == QLatin1String("fusion");
}

}  // namespace

QPalette darkPalette()
{
    QPalette palette(QColor(0x4a, 0x4a, 0x4a), QColor(0x38, 0x38, 0x38));
    const QColor text(0xee, 0xee, 0xee);
    const QColor faded(0x99, 0x99, 0x99);
    for (const auto role : {QPalette::WindowText, QPalette::Text, QPalette::ButtonText,
                            QPalette::ToolTipText, QPalette::BrightText, QPalette::HighlightedText})
        palette.setColor(role, text);
    palette.setColor(QPalette::Base, QColor(0x1e, 0x1e, 0x1e));
    palette.setColor(QPalette::AlternateBase, QColor(0x26, 0x26, 0x26));
    palette.setColor(QPalette::ToolTipBase, QColor(0x1e, 0x1e, 0x1e));
    palette.setColor(QPalette::Highlight, QColor(0x1a, 0x5f, 0xb4));
    palette.setColor(QPalette::Link, QColor(0x78, 0xae, 0xed));
    palette.setColor(QPalette::LinkVisited, QColor(0xc0, 0x9c, 0xe8));
    palette.setColor(QPalette::PlaceholderText, faded);
    for (const auto role : {QPalette::WindowText, QPalette::Text, QPalette::ButtonText})
        palette.setColor(QPalette::Disabled, role, faded);
    return palette;
}

ColorScheme::ColorScheme(QDBusConnection bus)
{
    // Known by its name before the slot is connected, or no signal would reach it.
    qRegisterMetaType<QDBusVariant>("QDBusVariant");
    bus.connect(service, path, interface, QStringLiteral("SettingChanged"), this,
                SLOT(settingChanged(QString, QString, QDBusVariant)));
    ask(bus);
}

void ColorScheme::ask(QDBusConnection& bus)
{
    QDBusMessage call =
        QDBusMessage::createMethodCall(service, path, interface, QStringLiteral("Read"));
    call << appearance << colorScheme;
    auto* const answer = new QDBusPendingCallWatcher(bus.asyncCall(call), this);
    connect(answer, &QDBusPendingCallWatcher::finished, this, [this, answer] {
        const QDBusPendingReply<QDBusVariant> reply = *answer;
        // The portal wraps the value twice.
        if (!reply.isError())
            adopt(reply.value().variant().value<QDBusVariant>().variant().toUInt());
        answer->deleteLater();
    });
}

void ColorScheme::settingChanged(const QString& group, const QString& key,
                                 const QDBusVariant& value)
{
    if (group == appearance && key == colorScheme)
        adopt(value.variant().toUInt());
}

void ColorScheme::adopt(uint preference)
{
    const bool mustBeDark = preference == prefersDark;
    if (mustBeDark == isDark_)
        return;
    if (mustBeDark && (!canBeDyed() || !isLight(QApplication::palette())))
        return;
    isDark_ = mustBeDark;
    // A palette that says nothing gives way to the desktop's own.
    QApplication::setPalette(mustBeDark ? darkPalette() : QPalette());
}

}  // namespace orvane::desktop
