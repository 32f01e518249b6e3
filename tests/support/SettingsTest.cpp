// SPDX-License-Identifier: Apache-2.0
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

}  // namespace
}  // namespace orvane
