// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/ColorScheme.h"

#include <QApplication>
#include <QDBusMessage>
#include <QDBusPendingCallWatcher>
#include <QDBusPendingReply>
#include <QPainter>
#include <QStyle>
#include <QStyleOption>

#include <algorithm>
#include <cmath>

namespace orvane::desktop {
namespace {

// Relative luminance as in WCAG 2.1, for sRGB.
double luminance(const QColor& color)
{
    const auto linear = [](double part) {
        return part <= 0.03928 ? part / 12.92 : std::pow((part + 0.055) / 1.055, 2.4);
    };
    return 0.2126 * linear(color.redF()) + 0.7152 * linear(color.greenF()) +
           0.0722 * linear(color.blueF());
}

constexpr int lightnessSteps = 50;
constexpr double frameShare = 0.4;  ///< of the ground in the colour of a frame

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
    const auto* const framed = dynamic_cast<const FramedStyle*>(QApplication::style());
    return framed != nullptr || QApplication::style()->name() == QLatin1String("fusion");
}

}  // namespace

double contrastRatio(const QColor& a, const QColor& b)
{
    const auto [darker, lighter] = std::minmax({luminance(a), luminance(b)});
    return (lighter + 0.05) / (darker + 0.05);
}

QColor readableOn(const QColor& background, const QColor& wanted, double contrast)
{
    if (contrastRatio(background, wanted) >= contrast)
        return wanted;
    const bool darkens =
        contrastRatio(background, Qt::black) >= contrastRatio(background, Qt::white);
    float hue = 0;
    float saturation = 0;
    float lightness = 0;
    wanted.toHsl().getHslF(&hue, &saturation, &lightness);
    const float end = darkens ? 0.0F : 1.0F;
    for (int step = 1; step < lightnessSteps; ++step) {
        const float part = static_cast<float>(step) / lightnessSteps;
        const QColor candidate =
            QColor::fromHslF(std::max(hue, 0.0F), saturation, lightness + (end - lightness) * part)
                .toRgb();
        if (contrastRatio(background, candidate) >= contrast)
            return candidate;
    }
    return darkens ? Qt::black : Qt::white;
}

QColor mixedColor(const QColor& a, const QColor& b, double share)
{
    const auto between = [share](double from, double to) {
        return static_cast<float>(from + (to - from) * share);
    };
    return QColor::fromRgbF(between(a.redF(), b.redF()), between(a.greenF(), b.greenF()),
                            between(a.blueF(), b.blueF()));
}

FramedStyle::FramedStyle() : QProxyStyle(QStringLiteral("fusion")) {}

void FramedStyle::drawPrimitive(PrimitiveElement element, const QStyleOption* option,
                                QPainter* painter, const QWidget* widget) const
{
    QProxyStyle::drawPrimitive(element, option, painter, widget);
    const bool isRound = element == PE_IndicatorRadioButton;
    if (element != PE_IndicatorCheckBox && !isRound)
        return;
    const bool isEnabled = option->state.testFlag(State_Enabled);
    const auto group = isEnabled ? QPalette::Active : QPalette::Disabled;
    painter->save();
    painter->setRenderHint(QPainter::Antialiasing);
    painter->setPen(mixedColor(option->palette.color(group, QPalette::WindowText),
                               option->palette.color(group, QPalette::Base), frameShare));
    painter->setBrush(Qt::NoBrush);
    const QRectF frame = QRectF(option->rect).adjusted(0.5, 0.5, -0.5, -0.5);
    if (isRound)
        painter->drawEllipse(frame);
    else
        painter->drawRect(frame);
    painter->restore();
}

void FramedStyle::polish(QPalette& palette)
{
    QProxyStyle::polish(palette);
    for (const auto group : {QPalette::Active, QPalette::Inactive}) {
        const auto color = [&](QPalette::ColorRole role) {
            return palette.color(group, role);
        };
        palette.setColor(group, QPalette::Highlight,
                         readableOn(color(QPalette::HighlightedText), color(QPalette::Highlight)));
        const QColor quiet = color(QPalette::PlaceholderText);
        const QColor ground = color(QPalette::Base);
        palette.setColor(group, QPalette::PlaceholderText,
                         readableOn(ground, mixedColor(ground, quiet, quiet.alphaF())));
    }
}

int FramedStyle::styleHint(StyleHint hint, const QStyleOption* option, const QWidget* widget,
                           QStyleHintReturn* answer) const
{
    return hint == SH_Menu_AllowActiveAndDisabled
               ? 1
               : QProxyStyle::styleHint(hint, option, widget, answer);
}

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
