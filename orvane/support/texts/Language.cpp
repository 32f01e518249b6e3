// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/texts/Language.h"

#include <fmt/format.h>
#include <langinfo.h>

#include <algorithm>
#include <array>
#include <atomic>
#include <clocale>
#include <cmath>
#include <mutex>
#include <string_view>

namespace orvane {
namespace {

std::mutex lock;
std::string inForce;  // guarded by the lock
std::atomic<std::uint64_t> revision = 1;

std::string firstSet(const EnvironmentLookup& environment)
{
    for (const char* const name : {"LC_ALL", "LC_MESSAGES", "LANG"})
        if (std::string value = environment(name).value_or(""); !value.empty())
            return value;
    return {};
}

bool isUTF8Locale()
{
    return std::string_view(::nl_langinfo(CODESET)) == "UTF-8";
}

}  // namespace

// The C locale asks for untranslated texts, whatever LANGUAGE says (gettext manual, 2.3.3); C.UTF-8
// does not.
std::string wantedLanguages(const EnvironmentLookup& environment)
{
    const std::string locale = firstSet(environment);
    if (locale.empty() || locale == "C" || locale == "POSIX")
        return {};
    std::string languages = environment("LANGUAGE").value_or("");
    if (!languages.empty())
        return languages;
    const std::string language = locale.substr(0, locale.find_first_of(".@"));
    return language == "C" || language == "POSIX" ? std::string() : language;
}

void adoptUserLocale()
{
    const std::string languages = wantedLanguages(environmentValue);
    if (std::setlocale(LC_ALL, "") == nullptr || !isUTF8Locale())
        std::setlocale(LC_ALL, "C.UTF-8");
    std::setlocale(LC_NUMERIC, "C");
    setLanguage(languages);
}

void setLanguage(const std::string& languages)
{
    const std::lock_guard guard(lock);
    inForce = languages;
    ++revision;
}

std::string currentLanguages()
{
    const std::lock_guard guard(lock);
    return inForce;
}

std::string currentLanguage()
{
    const std::string languages = currentLanguages();
    const std::string first = languages.substr(0, languages.find(':'));
    return first == "C" ? std::string() : first.substr(0, first.find_first_of(".@"));
}

std::vector<std::string> languageFolders(std::string_view languages)
{
    std::vector<std::string> names;
    while (!languages.empty()) {
        std::string_view language = languages.substr(0, languages.find(':'));
        languages.remove_prefix(std::min(language.size() + 1, languages.size()));
        language = language.substr(0, language.find('.'));
        // The texts in the programs are English.
        if (language == "C" || language == "POSIX" || language == "en" ||
            language.starts_with("en_"))
            break;
        for (const char* const end : {"", "@", "_"}) {
            const std::string_view name =
                *end == '\0' ? language : language.substr(0, language.find(*end));
            if (!name.empty() && name.find('/') == std::string_view::npos &&
                (names.empty() || names.back() != name))
                names.emplace_back(name);
        }
    }
    return names;
}

std::uint64_t languageRevision()
{
    return revision;
}

namespace {

struct Separators {
    std::string_view language;
    std::string_view group;
    std::string_view decimal;
};

constexpr std::string_view noBreakSpace = "\u00A0";
constexpr std::string_view narrowNoBreakSpace = "\u202F";

constexpr std::array<Separators, 20> known{{
    {"de_CH", "’", "."},
    {"de_AT", noBreakSpace, ","},
    {"es_MX", ",", "."},
    {"cs", noBreakSpace, ","},
    {"da", ".", ","},
    {"de", ".", ","},
    {"es", ".", ","},
    {"fi", noBreakSpace, ","},
    {"fr", narrowNoBreakSpace, ","},
    {"hu", noBreakSpace, ","},
    {"id", ".", ","},
    {"it", ".", ","},
    {"nb", noBreakSpace, ","},
    {"nl", ".", ","},
    {"pl", noBreakSpace, ","},
    {"pt", ".", ","},
    {"ru", noBreakSpace, ","},
    {"sv", noBreakSpace, ","},
    {"tr", ".", ","},
    {"uk", noBreakSpace, ","},
}};

// Territories stand before their languages, so the first row that fits is the closest.
Separators separatorsOf(std::string_view language)
{
    const auto found = std::find_if(known.begin(), known.end(), [&](const Separators& row) {
        return language == row.language ||
               (row.language.size() == 2 && language.substr(0, 3).starts_with(row.language) &&
                (language.size() == 2 || language[2] == '_'));
    });
    return found != known.end() ? *found : Separators{"", ",", "."};
}

std::string grouped(std::string_view digits, std::string_view separator)
{
    std::string text;
    for (std::size_t i = 0; i < digits.size(); ++i) {
        if (i > 0 && (digits.size() - i) % 3 == 0)
            text += separator;
        text += digits[i];
    }
    return text;
}

std::string plainDigits(const contract::Value& number)
{
    if (number.kind() != contract::Kind::Real)
        return fmt::format("{}", number.integer());
    std::string digits = fmt::format("{:.3f}", number.real());
    digits.erase(digits.find_last_not_of('0') + 1);
    if (digits.ends_with('.'))
        digits.pop_back();
    return digits == "-0" ? "0" : digits;
}

}  // namespace

std::string decimalText(const contract::Value& number, std::string_view language)
{
    if (number.kind() == contract::Kind::Real && !std::isfinite(number.real()))
        return fmt::format("{}", number.real());
    const Separators separators = separatorsOf(language);
    std::string_view digits;
    const std::string plain = plainDigits(number);
    digits = plain;
    std::string text;
    if (digits.starts_with('-')) {
        text += '-';
        digits.remove_prefix(1);
    }
    const std::size_t point = std::min(digits.find('.'), digits.size());
    text += grouped(digits.substr(0, point), separators.group);
    if (point < digits.size())
        text.append(separators.decimal).append(digits.substr(point + 1));
    return text;
}

}  // namespace orvane
