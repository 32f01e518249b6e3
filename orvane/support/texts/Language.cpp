// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/texts/Language.h"

#include <langinfo.h>

#include <atomic>
#include <clocale>
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

std::uint64_t languageRevision()
{
    return revision;
}

}  // namespace orvane
