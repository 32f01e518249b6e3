// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Value.h"
#include "orvane/support/settings/XDGPaths.h"

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace orvane {

/// The languages that the locale variables ask for, as gettext's LANGUAGE variable has them
/// ("de_DE", "pt_BR:pt"): LANGUAGE itself when it is set, else from LC_ALL, LC_MESSAGES or LANG,
/// the first that is not empty. Empty for the C locale, which is English.
[[nodiscard]] std::string wantedLanguages(const EnvironmentLookup& environment);

/// Start-up, before any other thread. Adopts the user's locale. Where the system has it not, or
/// it is not in UTF-8 (a rescue system has no locales), C.UTF-8 takes its place; translated texts
/// still come. Numbers keep the C locale's form: what the program writes for machines must not
/// change with the user; people's numbers come from decimalText.
void adoptUserLocale();

/// Switches the languages of every catalogue, a list as LANGUAGE has it ("" for English). Any
/// thread.
void setLanguage(const std::string& languages);

/// The languages in force ("lb:de"); empty for English. Any thread.
[[nodiscard]] std::string currentLanguages();

/// The first of them, without its character set ("de_DE"); empty for English.
[[nodiscard]] std::string currentLanguage();

/// The folders in which texts for these languages lie, the best first, with those that each falls
/// back to: "de_AT@euro" is read as "de_AT" and as "de". English, in which the programs' own texts
/// are, and what comes after it are left out.
[[nodiscard]] std::vector<std::string> languageFolders(std::string_view languages);

/// Another number after every setLanguage. Any thread.
[[nodiscard]] std::uint64_t languageRevision();

/// A number in the decimal style of a language ("de", "de_CH", empty for English): grouped by
/// thousands, with at most three decimals. The separators are those of the Unicode CLDR for the
/// common languages, and English ones for any other; the system's locales are not asked, because
/// a rescue system has none. Anything but a number reads as 0.
[[nodiscard]] std::string decimalText(const contract::Value& number, std::string_view language);

}  // namespace orvane
