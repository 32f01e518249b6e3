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
struct Sentence {
    std::string_view key;
    LinePhrase meaning;
};
constexpr Sentence sentences[] = {
    {"The volume “%@” appears to be OK.", LinePhrase::Success},
    {"The volume “%@” was repaired successfully.", LinePhrase::Success},
    {"The volume “%@” needs to be repaired.", LinePhrase::Failure},
    {"The volume “%@” could not be repaired.", LinePhrase::Failure},
};

std::vector<std::string> languages(const std::filesystem::path& locale)
{
    std::vector<std::string> found{"C"};
    for (const auto& entry : std::filesystem::directory_iterator(locale))
        found.push_back(entry.path().filename());
    return found;
}

}  // namespace

TEST(ResultTexts, EveryLanguageReadsItsOwnVerdictsRight)
{
    orvane::adoptUserLocale();
    const std::filesystem::path locale = FIXWELL_LOCALE;
    const orvane::Catalogue catalogue(locale);
    const auto all = languages(locale);
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
        for (const Sentence& sentence : sentences) {
            const std::string said = format(catalogue.translate(table, sentence.key), {"Daten"});
            EXPECT_NE(said.find("Daten"), std::string::npos) << said;
            const std::size_t first = matcher.firstIn(said);
            ASSERT_NE(first, PhraseMatcher::none) << language << ": " << said;
            EXPECT_EQ(resultPhrases[first].meaning, sentence.meaning) << language << ": " << said;
        }
    }
    orvane::setLanguage("");
}
