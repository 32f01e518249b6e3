// SPDX-License-Identifier: Apache-2.0
#include "contract/foundation/Format.h"
#include "contract/foundation/PhraseMatcher.h"
#include "contract/pellar/ResultPhrases.h"
#include "orvane/support/texts/Catalogue.h"
#include "orvane/support/texts/Language.h"

#include <gtest/gtest.h>

#include <filesystem>
#include <string>
#include <vector>

namespace {

using namespace contract;

constexpr std::string_view table = "LocalizableFsck";

/// The whole sentences that the library says, and what the module must read out of each.
constexpr std::pair<std::string_view, LinePhrase> sentences[] = {
    {"The volume “%@” appears to be OK.", LinePhrase::Success},
    {"The volume “%@” was repaired successfully.", LinePhrase::Success},
    {"The volume “%@” needs to be repaired.", LinePhrase::Failure},
    {"The volume “%@” could not be repaired.", LinePhrase::Failure},
};

}  // namespace

TEST(ResultTexts, EveryLanguageReadsItsOwnVerdictsRight)
{
    orvane::adoptUserLocale();
    const std::filesystem::path locale = FIXWELL_LOCALE;
    const orvane::Catalogue catalogue(locale);
    std::vector<std::string> all{"C"};
    for (const auto& entry : std::filesystem::directory_iterator(locale))
        if (std::filesystem::exists(entry.path() / "LC_MESSAGES" / (std::string(table) + ".mo")))
            all.push_back(entry.path().filename());
    ASSERT_GE(all.size(), 2U) << "there is a translation to be tested";
    for (const std::string& language : all) {
        orvane::setLanguage(language);
        std::vector<std::string> phrases;
        for (const ResultPhrase& phrase : resultPhrases) {
            EXPECT_EQ(catalogue.find(table, phrase.key).has_value(), language != "C")
                << language << ": " << phrase.key;
            phrases.push_back(catalogue.translate(table, phrase.key));
        }
        const PhraseMatcher matcher(phrases);
        for (const auto& [key, meaning] : sentences) {
            const std::string said = format(catalogue.translate(table, key), {"Daten"});
            const std::size_t first = matcher.firstIn(said);
            ASSERT_NE(first, PhraseMatcher::none) << language << ": " << said;
            EXPECT_EQ(resultPhrases[first].meaning, meaning) << language << ": " << said;
        }
    }
    orvane::setLanguage("");
}
