// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/ColorScheme.h"
#include "tests/desktop/session/PrivateBus.h"

#include <QApplication>
#include <QTest>

#include <gtest/gtest.h>

namespace orvane::desktop::test {
namespace {

constexpr int longestWait = 5000;  // milliseconds

const QString appearance = QStringLiteral("org.freedesktop.appearance");
const QString colorScheme = QStringLiteral("color-scheme");

/// The settings portal of a desktop.
class FakePortal final : public QObject {
    Q_OBJECT
    Q_CLASSINFO("D-Bus Interface", "org.freedesktop.portal.Settings")

public:
    explicit FakePortal(QDBusConnection bus)
    {
        bus.registerObject(QStringLiteral("/org/freedesktop/portal/desktop"), this,
                           QDBusConnection::ExportAllSlots | QDBusConnection::ExportAllSignals);
        bus.registerService(QStringLiteral("org.freedesktop.portal.Desktop"));
    }

    void change(uint scheme) { emit SettingChanged(appearance, colorScheme, QDBusVariant(scheme)); }

public slots:
    QDBusVariant Read(const QString& group, const QString& key)
    {
        const bool isKnown = group == appearance && key == colorScheme;
        return QDBusVariant(QVariant::fromValue(QDBusVariant(isKnown ? 1U : 0U)));
    }

signals:
    void SettingChanged(const QString& group, const QString& key, const QDBusVariant& value);
};

bool isDark()
{
    return QApplication::palette().color(QPalette::Base).lightness() < 128;
}

TEST(ColorScheme, FollowsTheDesktopButForWhatIsDarkAlready)
{
    PrivateBus bus;
    if (!bus.isRunning())
        GTEST_SKIP() << "no bus can be started (package dbus-daemon)";
    FakePortal portal(bus.connection("portal"));
    ASSERT_FALSE(isDark());
    const ColorScheme scheme(bus.connection("program"));
    EXPECT_TRUE(QTest::qWaitFor(isDark, longestWait)) << "as it is when the program begins";
    for (const uint wanted : {2U, 1U, 0U}) {
        portal.change(wanted);
        EXPECT_TRUE(QTest::qWaitFor([=] { return isDark() == (wanted == 1); }, longestWait));
    }
    const QPalette before = QApplication::palette();
    const QColor own(0x10, 0x20, 0x30);
    QApplication::setPalette(QPalette(own, own));
    for (const uint wanted : {1U, 0U}) {
        portal.change(wanted);
        QTest::qWait(100);
    }
    EXPECT_EQ(QApplication::palette().color(QPalette::Window), own);
    QApplication::setPalette(before);
}

}  // namespace
}  // namespace orvane::desktop::test

#include "ColorSchemeTest.moc"
