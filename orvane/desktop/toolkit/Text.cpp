// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/Text.h"

#include "contract/foundation/UTF8.h"

#include <QColor>
#include <QCoreApplication>
#include <QLibraryInfo>
#include <QLocale>
#include <QTranslator>

#include <algorithm>
#include <cstdio>
#include <utility>

namespace orvane::desktop {
namespace {

void appendEscaped(std::string& html, char32_t character)
{
    switch (character) {
        case '&': html += "&amp;"; return;
        case '<': html += "&lt;"; return;
        case '>': html += "&gt;"; return;
        case '"': html += "&quot;"; return;
        case '\'': html += "&#39;"; return;
        default: break;
    }
    contract::appendUTF8(html, character);
}

std::string points(double number)
{
    char digits[32];
    std::snprintf(digits, sizeof digits, "%.1fpt", number);
    for (char& digit : digits)
        if (digit == ',')  // the locale's decimal point
            digit = '.';
    return digits;
}

std::string spanStart(const contract::TextStyle& style, double fontScale)
{
    std::string css;
    if (style.font) {
        css += style.font->isBold ? "font-weight:bold;" : "font-weight:normal;";
        css += "font-size:" + points(style.font->points * fontScale) + ";";
    }
    if (style.color)
        css += "color:" +
               QColor::fromRgbF(static_cast<float>(style.color->red),
                                static_cast<float>(style.color->green),
                                static_cast<float>(style.color->blue))
                   .name()
                   .toStdString() +
               ";";
    return "<span style=\"" + css + "\">";
}

std::string paragraphStart(const contract::TextStyle& style)
{
    const contract::ParagraphStyle paragraph = style.paragraph.value_or(contract::ParagraphStyle());
    const auto pixels = [](double number) {
        return std::to_string(static_cast<int>(number)) + "px";
    };
    return "<p style=\"margin:0px;white-space:pre-wrap;margin-bottom:" +
           pixels(paragraph.spacingAfter) + ";margin-left:" + pixels(paragraph.headIndent) +
           ";text-indent:" + pixels(paragraph.firstLineIndent - paragraph.headIndent) + "\">";
}

}  // namespace

QString toQt(std::string_view text)
{
    return QString::fromUtf8(text.data(), static_cast<qsizetype>(text.size()));
}

QString toQtLine(std::string_view text)
{
    return toQt(contract::printable(text));
}

std::string fromQt(const QString& text)
{
    return text.toStdString();
}

QString toQtTitle(std::string_view title)
{
    return toQt(title).replace(u'&', QStringLiteral("&&"));
}

QString toQtToolTip(std::string_view text)
{
    if (text.empty())
        return {};
    return QStringLiteral("<p style=\"white-space:pre-wrap\">") + toQt(text).toHtmlEscaped() +
           QStringLiteral("</p>");
}

std::string html(const contract::StyledText& text, double fontScale)
{
    std::string result;
    bool isInParagraph = false;
    std::string_view rest = text.characters();
    for (const contract::StyledText::Run& run : text.runs()) {
        std::string_view characters = rest.substr(0, run.length);
        rest.remove_prefix(run.length);
        const std::string span = spanStart(*run.style, fontScale);
        while (!characters.empty()) {
            const bool startsParagraph = !std::exchange(isInParagraph, true);
            if (startsParagraph)
                result += paragraphStart(*run.style);
            const std::size_t end = std::min(characters.find('\n'), characters.size());
            const std::string_view line = characters.substr(0, end);
            result += span;
            // HTML 5 has no place for control characters.
            contract::forEachCharacter(contract::printable(line), [&result](char32_t character) {
                appendEscaped(result, character);
            });
            // A paragraph without contents would have no height.
            result += line.empty() && startsParagraph ? "&nbsp;</span>" : "</span>";
            if (end < characters.size()) {
                result += "</p>";
                isInParagraph = false;
            }
            characters.remove_prefix(std::min(end + 1, characters.size()));
        }
    }
    return isInParagraph ? result + "</p>" : result;
}

QByteArray storedBytes(const contract::UserDefaults& settings, std::string_view key)
{
    const contract::Value value = settings.objectForKey(key);
    return QByteArray::fromBase64(QByteArray::fromStdString(std::string(value.string())));
}

void storeBytes(contract::UserDefaults& settings, std::string_view key, const QByteArray& bytes)
{
    const std::string text = bytes.toBase64().toStdString();
    if (settings.objectForKey(key).string() != text)
        settings.setObjectForKey(contract::Value(text), key);
}

std::string languageOf(const contract::Bundle& bundle)
{
    return bundle.localizedString("en");
}

void translateQt(const contract::Bundle& bundle)
{
    const std::string language = languageOf(bundle);
    if (language == "en")
        return;
    auto translator = std::make_unique<QTranslator>();
    if (!translator->load(QLocale(toQt(language)), QStringLiteral("qtbase"), QStringLiteral("_"),
                          QLibraryInfo::path(QLibraryInfo::TranslationsPath)))
        return;
    translator->setParent(QCoreApplication::instance());
    QCoreApplication::installTranslator(translator.release());
}

}  // namespace orvane::desktop
