// SPDX-License-Identifier: Apache-2.0
#include "tests/terminal/ProgramTest.h"

#include <sys/stat.h>
#include <unistd.h>

namespace orvane::test {
namespace {

constexpr uid_t nobody = 65534;

class BadInputTest : public ProgramTest {
protected:
    /// As somebody for whom files can be unreadable, which they never are for root.
    RunResult runAsOrdinaryUser(std::vector<std::string> arguments) const
    {
        Launch started = launch(std::move(arguments));
        if (::geteuid() == 0) {
            started.user = nobody;
            EXPECT_EQ(::chown(path("").c_str(), nobody, nobody), 0);
        }
        return Program(started).finish();
    }

    static bool isReachableByAll(std::filesystem::path file)
    {
        using std::filesystem::perms;
        for (; file != file.root_path(); file = file.parent_path())
            if ((std::filesystem::status(file).permissions() & perms::others_exec) == perms::none)
                return false;
        return true;
    }
};

TEST_F(BadInputTest, OneSentenceAndOneEventNameTheObject)
{
    write(path("\x1b[2Jempty"), {});
    struct Case {
        std::string argument;
        std::string_view names;
        std::string_view says;
    };
    for (const Case& c : {
             Case{"\x1b[2Jnope\x07", "nope", "No such file"},
             Case{"\x1b[2Jempty", "empty", "empty"},
             Case{"nope\nfixwell: all is well", "nope", "No such file"},
             Case{"", "‘’", "no name"},
         }) {
        const RunResult result = run({"verify", c.argument});
        EXPECT_EQ(result.status, 8) << c.argument << result.output << result.errors;
        EXPECT_EQ(result.output, "") << c.argument;
        EXPECT_EQ(linesOf(result.errors).size(), 1U) << c.argument << "\n" << result.errors;
        EXPECT_NE(result.errors.find(c.names), std::string::npos) << result.errors;
        EXPECT_NE(result.errors.find(c.says), std::string::npos) << result.errors;
        EXPECT_FALSE(holdsControls(result.errors)) << c.argument;

        const RunResult inEvents = run({"verify", "--json", c.argument});
        const auto finished = Events(inEvents.output).named("finished");
        ASSERT_EQ(finished.size(), 1U) << inEvents.output;
        EXPECT_EQ(finished.front()["disk"], c.argument) << "as another program can match it";
        EXPECT_FALSE(holdsControls(inEvents.output)) << c.argument;
    }
}

TEST_F(BadInputTest, WhatTheUserMayNotDoIsSaidWithTheReason)
{
    if (::geteuid() == 0 && !isReachableByAll(TERMINAL_PROGRAM))
        GTEST_SKIP() << "an ordinary user cannot reach " << TERMINAL_PROGRAM;
    const auto image = makeDamagedVolume("image");
    const std::string before = contentsOf(image);
    ASSERT_EQ(::chmod(image.c_str(), 0444), 0);
    EXPECT_EQ(runAsOrdinaryUser({"verify", "image"}).status, 4);
    const RunResult repaired = runAsOrdinaryUser({"repair", "image"});
    EXPECT_EQ(repaired.status, 8) << repaired.output << repaired.errors;
    EXPECT_EQ(countOf("The disk cannot be written, so it cannot be repaired.", repaired.output), 1U)
        << repaired.output;
    EXPECT_TRUE(contentsOf(image) == before);

    ASSERT_EQ(::chmod(image.c_str(), 0), 0);
    const RunResult unread = runAsOrdinaryUser({"verify", "image"});
    EXPECT_EQ(unread.status, 8);
    EXPECT_NE(unread.errors.find("‘image’: Permission denied"), std::string::npos) << unread.errors;
}

TEST_F(BadInputTest, WrongUsageGoesToStandardErrorAndHelpToStandardOutput)
{
    const RunResult wrong = run({"verify"});
    EXPECT_EQ(wrong.status, 16);
    EXPECT_EQ(wrong.output, "");
    const RunResult help = run({"--help"});
    EXPECT_EQ(help.status, 0);
    EXPECT_NE(help.output.find("verify-permissions"), std::string::npos);
    EXPECT_EQ(help.errors, "");
}

// With standard output closed, its number goes to the next file that is opened: never the image.
TEST_F(BadInputTest, OutputThatCannotBeWrittenIsSaidAndHarmsNothing)
{
    for (const Launch::Output output : {Launch::Output::Closed, Launch::Output::Full}) {
        makeDamagedVolume("image");
        Launch launched = launch({"repair", "image"});
        launched.output = output;
        const RunResult result = Program(launched).finish();
        EXPECT_EQ(result.status, 1 | 8) << "repaired, but not all was told";
        EXPECT_EQ(result.errors, "fixwell: not all of the output could be written\n");
        EXPECT_EQ(run({"verify", "image"}).status, 0);
    }
}

TEST_F(BadInputTest, AnActionThatIsNotThereSaysTheModulesReason)
{
    makeVolume("whole");
    const RunResult result = run({"repair-permissions", "whole"});
    EXPECT_EQ(result.status, 8);
    EXPECT_NE(result.errors.find("the selected disk is not mounted."), std::string::npos);
}

}  // namespace
}  // namespace orvane::test
