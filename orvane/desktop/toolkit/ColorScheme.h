// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QColor>
#include <QDBusConnection>
#include <QDBusVariant>
#include <QObject>
#include <QPalette>
#include <QProxyStyle>

namespace orvane::desktop {

/// The smallest ratio at which text of ordinary size is readable (WCAG 2.1, 1.4.3).
inline constexpr double readableContrast = 4.5;
/// The smallest one at which a mark or a frame is seen (1.4.11).
inline constexpr double visibleContrast = 3;

/// From 1 (the same colour) to 21 (black on white), as WCAG 2.1 defines the contrast ratio.
double contrastRatio(const QColor& a, const QColor& b);

/// `wanted`, or the nearest lighter or darker colour of its hue that has this contrast to
/// `background`. All are opaque.
QColor readableOn(const QColor& background, const QColor& wanted,
                  double contrast = readableContrast);

/// `share` of the way from `a` to `b`.
QColor mixedColor(const QColor& a, const QColor& b, double share);

/// The style "Fusion" with frames around check boxes and radio buttons that are seen on dark ground
/// as well (WCAG 2.1, 1.4.11), and with menus in which the arrow keys also come to what is grey, so
/// that its reason can be read.
class FramedStyle final : public QProxyStyle {
public:
    FramedStyle();

    void drawPrimitive(PrimitiveElement element, const QStyleOption* option, QPainter* painter,
                       const QWidget* widget) const override;
    /// What is selected, and what stands in an empty field, can be read.
    void polish(QPalette& palette) override;
    using QProxyStyle::polish;
    int styleHint(StyleHint hint, const QStyleOption* option, const QWidget* widget,
                  QStyleHintReturn* answer) const override;
};

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
