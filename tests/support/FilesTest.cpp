// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/files/ActivityLog.h"
#include "orvane/support/settings/RepairSettings.h"
#include "orvane/support/settings/SettingsFile.h"
#include "orvane/support/settings/XDGPaths.h"
#include "tests/support/TestDirectory.h"

#include <gtest/gtest.h>
#include <sys/stat.h>

#include <map>

namespace orvane {
namespace {

using test::contentsOf;
using test::TestDirectory;

TEST(XDGPaths, VariablesHomesAndNothingAtAll)
{
    struct Case {
        std::map<std::string, std::string> environment;
        const char* accountHome;
        const char* config;
        const char* because;
    };
    for (const Case& c :
         {Case{{{"HOME", "/h"}}, "/p", "/h/.config/orvane", "the default below HOME"},
          Case{{{"HOME", "/h"}, {"XDG_CONFIG_HOME", "/x"}}, "", "/x/orvane", "as asked for"},
          Case{{{"HOME", "/h"}, {"XDG_CONFIG_HOME", "x"}},
               "",
               "/h/.config/orvane",
               "a relative path is ignored"},
          Case{{{"HOME", "/foreign"}}, "/p", "/p/.config/orvane", "somebody else's home"},
          Case{{{"HOME", "/h"}, {"XDG_CONFIG_HOME", "/foreign"}},
               "/p",
               "/h/.config/orvane",
               "somebody else's directory in one's own home"},
          Case{{}, "/p", "/p/.config/orvane", "without HOME, the account's"},
          Case{{{"HOME", ""}}, "", "", "nowhere: nothing is kept"}}) {
        const auto paths = xdgPathsFrom(
            [&](const char* name) -> std::optional<std::string> {
                const auto found = c.environment.find(name);
                return found == c.environment.end() ? std::nullopt : std::optional(found->second);
            },
            c.accountHome,
            [](const std::filesystem::path& directory) {
                return directory.native().starts_with("/foreign");
            });
        EXPECT_EQ(paths.config, c.config) << c.because;
    }
}

struct Settings {
    std::filesystem::path file;
    std::vector<std::string> warnings;
    SettingsFile open()
    {
        return {file, [this](const std::string& text) {
                    warnings.push_back(text);
                }};
    }
};

TEST(SettingsFile, KeepsValuesAndTheirKinds)
{
    const TestDirectory directory;
    Settings settings{directory / "new/settings.json", {}};
    settings.open().setObjectForKey(true, "flag");
    settings.open().setObjectForKey(7, "number");
    settings.open().setObjectForKey("caf\xE9", "bytes");
    settings.open().setObjectForKey("No", "word");
    settings.open().setObjectForKey({}, "number");
    const SettingsFile read = settings.open();
    EXPECT_EQ(read.objectForKey("flag").kind(), contract::Kind::Boolean);
    EXPECT_TRUE(read.objectForKey("number").isNone()) << "no value removes the key";
    EXPECT_EQ(read.objectForKey("bytes").string(), "caf\xE9") << "any bytes";
    EXPECT_EQ(read.objectForKey("word").kind(), contract::Kind::Boolean) << "spells a truth value";
    struct stat status = {};
    ASSERT_EQ(::stat(settings.file.c_str(), &status), 0);
    EXPECT_EQ(status.st_mode & 0777U, 0600U);
}

TEST(RepairSettings, WhatIsNoSensibleNumberIsAsItWas)
{
    const TestDirectory directory;
    const auto file = directory / "settings.json";
    EXPECT_EQ(readRepairSettings(file), RepairSettings()) << "no file";
    test::write(file, R"({"keptRepairs": 3, "keptRepairDays": 0, "keptRepairMegabytes": 10,
                    "thoroughVerification": true})");
    EXPECT_EQ(readRepairSettings(file), (RepairSettings{3, 0, 10, true}));
    test::write(file, R"({"keptRepairs": -1, "keptRepairDays": "3", "keptRepairMegabytes": 1e30,
                    "thoroughVerification": "perhaps"})");
    EXPECT_EQ(readRepairSettings(file), RepairSettings());
    test::write(file, R"({"keptRepairs": 1000000, "keptRepairDays": 1000000})");
    EXPECT_EQ(readRepairSettings(file), (RepairSettings{unlimitedRepairs, mostRepairDays}));
    test::write(file, R"({"keptRepairs": 99999999999999999999})");
    EXPECT_EQ(readRepairSettings(file), RepairSettings());
    test::write(file, "[");
    EXPECT_EQ(readRepairSettings(file), RepairSettings());
}

TEST(SettingsFile, AnotherProgramsChangeIsKept)
{
    const TestDirectory directory;
    Settings settings{directory / "settings.json", {}};
    SettingsFile mine = settings.open();
    settings.open().setObjectForKey(1, "theirs");
    mine.setObjectForKey(2, "mine");
    EXPECT_EQ(settings.open().objectForKey("theirs").integer(), 1);
}

TEST(SettingsFile, BrokenFilesAreKeptAsideAndSaid)
{
    const std::string deep(100'000, '[');
    for (const std::string& broken :
         {std::string("{\"a\": tru"), std::string("[1, 2]"), std::string(), std::string("\xFF\xFE"),
          std::string("{\"a\":{\"dictionary\":[3]}}"),
          "{\"a\":" + deep + std::string(deep.size(), ']') + "}"}) {
        const TestDirectory directory;
        Settings settings{directory / "settings.json", {}};
        test::write(settings.file, broken);
        SettingsFile read = settings.open();
        EXPECT_EQ(settings.warnings.size(), 1U) << broken;
        read.setObjectForKey(true, "a");
        EXPECT_EQ(contentsOf(directory / "settings.json.broken"), broken) << "nothing is lost";
        EXPECT_TRUE(settings.open().objectForKey("a").boolean()) << "and a new one is begun";
    }
}

TEST(SettingsFile, WhereNothingCanBeWrittenTheyHoldInMemory)
{
    const TestDirectory directory;
    test::write(directory / "file", "in the way");
    Settings settings{directory / "file/settings.json", {}};
    SettingsFile mine = settings.open();
    mine.setObjectForKey(true, "a");
    mine.setObjectForKey(true, "b");
    EXPECT_TRUE(mine.objectForKey("a").boolean());
    EXPECT_EQ(settings.warnings.size(), 1U) << "said once";
}

TEST(SettingsFile, AReplacedFileIsNeverPartlyThere)
{
    const TestDirectory directory;
    Settings settings{directory / "settings.json", {}};
    SettingsFile mine = settings.open();
    mine.setObjectForKey("old", "a");
    const std::filesystem::path link = directory / "link";
    std::filesystem::create_hard_link(settings.file, link);
    mine.setObjectForKey("new", "a");
    EXPECT_NE(contentsOf(link).find("old"), std::string::npos) << "written beside, not into it";
    EXPECT_EQ(std::distance(std::filesystem::directory_iterator(directory.path()), {}), 2)
        << "no temporary file is left";
}

TEST(LogText, NothingInALogCommandsATerminal)
{
    struct Case {
        std::string_view text;
        std::string_view logged;
        const char* because;
    };
    for (const Case& c :
         {Case{"plain text of more than eight bytes\n", "plain text of more than eight bytes\n",
               "as it is"},
          Case{"12345678\x1b[2J", "12345678\uFFFD[2J", "an escape behind a whole word"},
          Case{"\x1b", "\uFFFD", "alone"},
          Case{"1234567\x7f", "1234567\uFFFD", "DEL as the last of eight"},
          Case{"a\rb\tc", "a\uFFFDb c", "a carriage return would overwrite the line"},
          Case{"Grüße\xff\n\n", "Grüße\uFFFD\n\n", "UTF-8 stays, other bytes go"}}) {
        std::string log;
        appendLogText(log, c.text);
        EXPECT_EQ(log, c.logged) << c.because;
    }
}

TEST(ActivityLog, EntriesWithAndWithoutLineEnds)
{
    const TestDirectory directory;
    {
        ActivityLog log({directory.path()}, [](const std::string& text) { ADD_FAILURE() << text; });
        log.logPriorityWithEOL("one", 0, true);
        log.logPriorityWithEOL("two ", 0, false);
        log.logPriorityWithEOL("halves", 0, true);
        log.logPriorityWithEOL("unfinished", 0, false);
        log.log("ended\n");
    }
    const std::string text = contentsOf(directory / "activity.log");
    EXPECT_EQ(text.find(" one\n"), std::string_view("2024-05-06 07:08:09").size());
    EXPECT_NE(text.find(" two halves\n"), std::string::npos) << "one stamp for one line";
    for (const char* const line : {" unfinished\n", " ended\n"})
        EXPECT_NE(text.find(line), std::string::npos) << "a line of its own:" << line << text;
}

TEST(ActivityLog, KeepsTheLevelsItWasAskedFor)
{
    const TestDirectory directory;
    ActivityLog log({directory.path(), contract::OVLog::error}, {});
    log.ov_log(contract::OVLog::trace, 0, "unheard");
    log.ov_log(contract::OVLog::error, 0, "bad \x1b[31mthing %s\n");
    const std::string text = contentsOf(directory / "fixwell.log");
    EXPECT_EQ(text.find("unheard"), std::string::npos);
    EXPECT_NE(text.find("notice bad \uFFFD[31mthing %s\n"), std::string::npos) << "there at once";
}

TEST(ActivityLog, NeverGrowsWithoutBound)
{
    const TestDirectory directory;
    ActivityLog::Options options{directory.path()};
    options.limits = {200'000, 2};
    {
        ActivityLog log(options, [](const std::string& text) { ADD_FAILURE() << text; });
        for (int i = 0; i < 50000; ++i)
            log.logPriorityWithEOL("a line of the checking tool", 0, true);
    }
    std::uintmax_t bytes = 0;
    for (const auto& file : std::filesystem::directory_iterator(directory.path()))
        bytes += file.file_size();
    EXPECT_LE(bytes, 3 * 200'000U);
    EXPECT_GE(bytes, 2 * 100'000U) << "the old files hold what was before";
}

TEST(ActivityLog, AFullDiskIsSaidOnceAndOverlooked)
{
    for (const std::string_view trouble : {"a full disk", "a file in the way"}) {
        const TestDirectory directory;
        // Every write to /dev/full answers that there is no space left (full(4)), but a link in
        // the log's place is refused before that.
        if (trouble == "a full disk")
            std::filesystem::create_symlink("/dev/full", directory / "activity.log");
        else
            test::write(directory / "file", "");
        int warnings = 0;
        ActivityLog log({trouble == "a full disk" ? directory.path() : directory / "file"},
                        [&](const std::string&) { ++warnings; });
        for (int i = 0; i < 3; ++i) {
            log.log("text\n");
            log.flush();
        }
        EXPECT_EQ(warnings, 1) << trouble;
    }
}

}  // namespace
}  // namespace orvane
