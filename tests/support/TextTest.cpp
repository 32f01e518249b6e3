// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/texts/Catalogue.h"
#include "orvane/support/texts/Language.h"
#include "orvane/support/texts/TimeEstimator.h"
#include "tests/support/TestDirectory.h"

#include <gtest/gtest.h>

#include <clocale>
#include <fstream>
#include <map>
#include <tuple>

namespace orvane {
namespace {

TEST(Language, WhatTheLocaleVariablesAskFor)
{
    struct Case {
        std::map<std::string, std::string> environment;
        const char* languages;
        const char* because;
    };
    for (const Case& c :
         {Case{{}, "", "nothing set: English"},
          Case{{{"LANG", "de_DE.UTF-8"}}, "de_DE", "without the character set"},
          Case{{{"LANG", "de_DE@euro"}, {"LC_ALL", ""}}, "de_DE", "an empty LC_ALL is unset"},
          Case{{{"LANG", "de_DE"}, {"LC_MESSAGES", "fr_FR"}}, "fr_FR", "messages go before"},
          Case{{{"LC_ALL", "C"}, {"LANG", "de_DE"}, {"LANGUAGE", "de"}}, "", "C forbids it"},
          Case{{{"LANG", "C.UTF-8"}, {"LANGUAGE", "de:fr"}}, "de:fr", "C.UTF-8 does not"},
          Case{{{"LANG", "de_DE.UTF-8"}, {"LANGUAGE", "pt_BR:pt"}}, "pt_BR:pt", "a list"}}) {
        const auto languages = wantedLanguages([&](const char* name) -> std::optional<std::string> {
            const auto found = c.environment.find(name);
            return found == c.environment.end() ? std::nullopt : std::optional(found->second);
        });
        EXPECT_EQ(languages, c.languages) << c.because;
    }
}

// Only the C.UTF-8 locale need be installed.
TEST(ModuleBundle, TextsComeFromTheCatalogueOfTheLanguage)
{
    ::setenv("LC_ALL", "tlh_QS.UTF-8", 1);
    adoptUserLocale();
    const ModuleBundle bundle(TEST_BUILD_DIRECTORY, "SupportTest");
    EXPECT_EQ(currentLanguage(), "tlh_QS");
    EXPECT_EQ(bundle.localizedString("Verify Disk"), "yIwaH – Qap’a’");
    EXPECT_EQ(bundle.localizedString("Missing", "fallback"), "fallback");
    EXPECT_EQ(bundle.localizedString("Verify Disk", "", "../SupportTest"), "Verify Disk");
    EXPECT_EQ(bundle.localizedString(""), "") << "not the catalogue's header";
    EXPECT_EQ(bundle.catalogue().translatePlural("SupportTest", "about %ld minute",
                                                 "about %ld minutes", 3),
              "few %ld");

    for (const auto& [languages, text, because] :
         {std::tuple{"", "Verify Disk", "English again, at once"},
          {"lb:tlh_QS.UTF-8@pIqaD:de", "yIwaH – Qap’a’", "the first of the list that is there"},
          {"en_GB:tlh", "Verify Disk", "English is what the programs are written in"},
          {"../share:tlh/..", "Verify Disk", "a way out of the folder is no language"}}) {
        const std::uint64_t revision = bundle.stringRevision();
        setLanguage(languages);
        EXPECT_NE(bundle.stringRevision(), revision) << languages;
        EXPECT_EQ(bundle.localizedString("Verify Disk"), text) << because;
    }
    setLanguage("");
    ::unsetenv("LC_ALL");
}

TEST(MessageFile, PluralRulesAreReadAsCReadsThem)
{
    constexpr std::string_view slavic =
        "n%10==1 && n%100!=11 ? 0 : n%10>=2 && n%10<=4 && (n%100<10 || n%100>=20) ? 1 : 2";
    struct Case {
        std::string_view rule;
        unsigned long n;
        std::optional<unsigned long> form;
    };
    for (const Case& c :
         {Case{"n != 1", 1, 0}, Case{"n != 1", 0, 1}, Case{"n>1", 1, 0}, Case{"0", 7, 0},
          Case{slavic, 21, 0}, Case{slavic, 11, 2}, Case{slavic, 22, 1}, Case{slavic, 112, 2},
          Case{"(n-1)*2+10/2", 3, 9}, Case{"!n", 0, 1}, Case{"n%0", 5, 0}, Case{"n==", 1, {}},
          Case{"n n", 1, {}}, Case{"(n", 1, {}}, Case{"99999999999", 1, {}}, Case{"", 1, {}}})
        EXPECT_EQ(pluralForm(c.rule, c.n), c.form) << c.rule << ", " << c.n;
    EXPECT_EQ(pluralForm(std::string(100000, '('), 1), std::nullopt) << "not to the stack's end";
}

// A catalogue that was cut anywhere has fewer texts, and no wrong ones.
TEST(MessageFile, ACutFileIsReadAsFarAsItGoes)
{
    const std::string whole = test::contentsOf(std::filesystem::path(TEST_BUILD_DIRECTORY) /
                                               "locale/tlh/LC_MESSAGES/SupportTest.mo");
    ASSERT_GT(whole.size(), 28U);
    const test::TestDirectory directory;
    for (std::size_t length = 0; length < whole.size(); ++length) {
        std::ofstream(directory / "cut.mo", std::ios::binary) << whole.substr(0, length);
        const auto file = MessageFile::read(directory / "cut.mo");
        const auto text = file ? file->find("Verify Disk") : std::nullopt;
        EXPECT_TRUE(!text || *text == "yIwaH – Qap’a’") << length;
    }
}

TEST(ModuleBundle, ResourcesStayInsideTheBundle)
{
    const ModuleBundle bundle(TEST_BUILD_DIRECTORY, "SupportTest");
    EXPECT_FALSE(bundle.pathForResource("locale/tlh").empty());
    for (const char* const name :
         {"", "nothing", "/etc/passwd", "../CMakeCache.txt", "locale/../.."})
        EXPECT_EQ(bundle.pathForResource(name), "") << name;
}

TEST(DecimalNumbers, GroupingByLanguage)
{
    struct Case {
        contract::Value number;
        const char* language;
        const char* text;
    };
    for (const Case& c :
         {Case{1234567, "", "1,234,567"}, Case{1234567, "en_GB", "1,234,567"},
          Case{1234567, "de", "1.234.567"}, Case{1234567, "de_CH", "1’234’567"},
          Case{-1234, "fr_FR", "-1\u202F234"}, Case{999, "de", "999"}, Case{0, "", "0"},
          Case{1234.5, "de_DE", "1.234,5"}, Case{-0.0001, "", "0"},
          Case{1234567, "den", "1,234,567"}, Case{INT64_MIN, "", "-9,223,372,036,854,775,808"}})
        EXPECT_EQ(decimalText(c.number, c.language), c.text) << c.language;
}

TEST(TimeEstimator, SaysNothingTooEarlyAndRoundsWhatItSays)
{
    using namespace std::chrono_literals;
    struct Case {
        std::chrono::seconds elapsed;
        double percent;
        const char* text;
    };
    for (const Case& c :
         {Case{1s, 50, ""}, Case{60s, 0.9, ""}, Case{60s, 0.0 / 0.0, ""}, Case{60s, 100, ""},
          Case{60s, 90, "less than a minute"}, Case{60s, 50, "about 1 minute"},
          Case{60s, 30, "about 2 minutes"}, Case{60s, 5, "about 20 minutes"},
          Case{600s, 5, "about 3 hours"}, Case{24h, 30, "about 2 days"}}) {
        TimeEstimator::Date now;
        TimeEstimator estimator([&] { return now; }, Translator());
        now += c.elapsed;
        EXPECT_EQ(estimator.timeEstimateString(c.percent), c.text)
            << c.elapsed.count() << " s, " << c.percent << "%";
    }
}

TEST(TimeEstimator, ABurstMovesTheEstimateSlowlyAndANewReferenceAtOnce)
{
    using namespace std::chrono_literals;
    TimeEstimator::Date now;
    TimeEstimator estimator([&] { return now; }, Translator());
    now += 60s;
    EXPECT_EQ(estimator.timeEstimateString(10), "about 9 minutes");
    now += 1s;
    EXPECT_EQ(estimator.timeEstimateString(50), "about 8 minutes") << "one second of a burst";
    now += 60s;
    EXPECT_EQ(estimator.timeEstimateString(50), "about 2 minutes") << "believed by now";
    estimator.setStartTimeWithPercentComplete(now - 60s, 40);
    EXPECT_EQ(estimator.timeEstimateString(50), "about 5 minutes");
    estimator.setStartTimeWithPercentComplete(now - 24h, 0);
    EXPECT_EQ(estimator.timeEstimateString(50), "about 2 minutes")
        << "no job began before it was made";
}

}  // namespace
}  // namespace orvane
