// SPDX-License-Identifier: Apache-2.0
#include "tests/terminal/ProgramTest.h"

#include <sys/stat.h>
#include <unistd.h>

#include <random>

namespace orvane::test {
namespace {

constexpr uid_t nobody = 65534;

class BadInputTest : public ProgramTest {
protected:
    void SetUp() override
    {
        ProgramTest::SetUp();
        std::filesystem::create_directory(path("directory"));
        write(path("empty"), {});
        write(path("noise"), noise(1 * mebibyte));
        write(path("zeros"), std::string(1 * mebibyte, '\0'));
        write(path("cut"), contentsOf(makeVolume("whole")).substr(0, 1500));
        write(path("%@ %s %n"), {});
        write(path("\x1b[2Jempty"), {});
        ASSERT_EQ(::mkfifo(path("fifo").c_str(), 0600), 0);
        std::filesystem::create_symlink(path("loop"), path("loop"));
    }

    /// As somebody for whom files can be unreadable, which they never are for root.
    Launch launchAsOrdinaryUser(std::vector<std::string> arguments) const
    {
        Launch started = launch(std::move(arguments));
        if (::geteuid() == 0) {
            started.user = nobody;
            EXPECT_EQ(::chown(path("").c_str(), nobody, nobody), 0);
        }
        return started;
    }

    static bool isReachableByAll(std::filesystem::path file)
    {
        using std::filesystem::perms;
        for (; file != file.root_path(); file = file.parent_path())
            if ((std::filesystem::status(file).permissions() & perms::others_exec) == perms::none)
                return false;
        return true;
    }

    static std::string noise(std::size_t bytes)
    {
        std::mt19937 random(7);  // always the same
        std::string text(bytes, '\0');
        for (char& byte : text)
            byte = static_cast<char>(random());
        return text;
    }
};

struct Case {
    std::string_view argument;
    std::string_view names;
    std::string_view says;
};

const std::vector<Case> badInputs{
    {"missing", "missing", "No such file"},
    {"missing/deeper", "missing/deeper", "No such file"},
    {"empty/deeper", "empty/deeper", "Not a directory"},
    {"directory", "directory", "no mount point"},
    {"empty", "empty", "empty"},
    {"fifo", "fifo", "neither a disk nor a disk image"},
    {"loop", "loop", "symbolic links"},
    {"/dev/null", "/dev/null", "neither a disk nor a disk image"},
    {"LABEL=nope", "LABEL=nope", "no disk has this label"},
    {"UUID=nope", "UUID=nope", "no disk has this UUID"},
    {"LABEL=", "LABEL=", "no disk has this label"},
    {"\x1b[2Jnope\x07", "nope", "No such file"},
    {"\x1b[2Jempty", "empty", "empty"},
    {"%@ %s %n", "%@ %s %n", "empty"},
    {"nope\nfixwell: all is well", "nope", "No such file"},
    {"", "‘’", "no name"},
};

TEST_F(BadInputTest, OneSentenceNamesTheObject)
{
    for (const Case& c : badInputs)
        for (const char* const command : {"verify", "repair"}) {
            const RunResult result = run({command, std::string(c.argument)});
            EXPECT_EQ(result.status, 8) << c.argument << result.output << result.errors;
            EXPECT_EQ(result.output, "") << c.argument;
            EXPECT_EQ(linesOf(result.errors).size(), 1U) << c.argument << "\n" << result.errors;
            EXPECT_TRUE(result.errors.starts_with("fixwell: ")) << result.errors;
            EXPECT_NE(result.errors.find(c.names), std::string::npos) << result.errors;
            EXPECT_NE(result.errors.find(c.says), std::string::npos) << result.errors;
            EXPECT_FALSE(holdsControls(result.errors)) << c.argument;
        }
}

// These are files that might be images, so a job looks into them and its log has the sentence.
TEST_F(BadInputTest, WhatHoldsNoVolumeIsNamedInTheLog)
{
    for (const Case& c : {Case{"noise", "“noise”", "no file system was found"},
                          Case{"zeros", "“zeros”", "no file system was found"},
                          Case{"cut", "“cut”", "only 1500 bytes are there"}})
        for (const char* const command : {"verify", "repair"}) {
            const std::string before = contentsOf(path(c.argument));
            const RunResult result = run({command, std::string(c.argument)});
            EXPECT_EQ(result.status, 8) << c.argument << result.output << result.errors;
            EXPECT_EQ(countOf(c.says, result.output), 1U) << result.output;
            EXPECT_EQ(countOf("cannot " + std::string(command) + " " + std::string(c.names),
                              result.output),
                      1U)
                << result.output;
            EXPECT_EQ(result.errors, "");
            EXPECT_TRUE(contentsOf(path(c.argument)) == before) << c.argument;
        }
}

TEST_F(BadInputTest, AnEventForEachThatAnotherProgramCanMatch)
{
    for (const Case& c : badInputs) {
        const RunResult result = run({"verify", "--json", std::string(c.argument)});
        EXPECT_EQ(result.status, 8) << c.argument;
        const auto finished = Events(result.output).named("finished");
        ASSERT_EQ(finished.size(), 1U) << result.output;
        EXPECT_EQ(finished.front()["disk"], c.argument);
        EXPECT_EQ(finished.front()["verdict"], "failed");
        EXPECT_FALSE(holdsControls(result.output)) << c.argument;
    }
}

TEST_F(BadInputTest, WhatCannotBeReadIsNamedWithTheReason)
{
    if (::geteuid() == 0 && !isReachableByAll(TERMINAL_PROGRAM))
        GTEST_SKIP() << "an ordinary user cannot reach " << TERMINAL_PROGRAM;
    const auto image = makeVolume("image");
    ASSERT_EQ(::chmod(image.c_str(), 0), 0);
    const Launch started = launchAsOrdinaryUser({"verify", "image"});
    const RunResult result = Program(started).finish();
    EXPECT_EQ(result.status, 8);
    EXPECT_EQ(linesOf(result.errors).size(), 1U) << result.errors;
    EXPECT_NE(result.errors.find("‘image’: Permission denied"), std::string::npos) << result.errors;
}

TEST_F(BadInputTest, WhatCannotBeWrittenIsVerifiedButNotRepairedForThatReason)
{
    if (::geteuid() == 0 && !isReachableByAll(TERMINAL_PROGRAM))
        GTEST_SKIP() << "an ordinary user cannot reach " << TERMINAL_PROGRAM;
    makeDamagedVolume("damaged");
    makeVolume("sound");
    for (const auto& [image, verified] : {std::pair{"damaged", 4}, {"sound", 0}}) {
        ASSERT_EQ(::chmod(path(image).c_str(), 0444), 0);
        Launch started = launchAsOrdinaryUser({"verify", image});
        EXPECT_EQ(Program(started).finish().status, verified);
        const std::string before = contentsOf(path(image));
        started.arguments = {"repair", image};
        const RunResult result = Program(started).finish();
        EXPECT_EQ(result.status, 8) << result.output << result.errors;
        EXPECT_EQ(countOf("The disk cannot be written, so it cannot be repaired.", result.output), 1U)
            << result.output;
        EXPECT_TRUE(contentsOf(path(image)) == before);
    }
}

TEST_F(BadInputTest, WrongUsageIsSaidWithoutObeyingIt)
{
    struct Usage {
        std::vector<std::string> arguments;
        std::string_view because;
    };
    for (const Usage& c :
         {Usage{{}, "no command"}, Usage{{"verify"}, "no disk"}, Usage{{"mend", "a"}, "unknown"},
          Usage{{"verify", "--color=pink", "a"}, "no such choice"},
          Usage{{"verify", "--log-level=9", "a"}, "out of range"},
          Usage{{"verify", "--f\x1b[2Jast", "a"}, "an option with escapes"},
          Usage{{"\x1b]0;title\x07"}, "a command with escapes"}}) {
        const RunResult result = run(c.arguments);
        EXPECT_EQ(result.status, 16) << c.because;
        EXPECT_EQ(result.output, "") << c.because;
        EXPECT_TRUE(result.errors.starts_with("fixwell: ")) << c.because << result.errors;
        EXPECT_FALSE(holdsControls(result.errors)) << c.because;
    }
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
    for (const char* const command : {"verify-permissions", "repair-permissions"}) {
        const RunResult result = run({command, "whole"});
        EXPECT_EQ(result.status, 8);
        EXPECT_EQ(linesOf(result.errors).size(), 1U);
        EXPECT_NE(result.errors.find("whole"), std::string::npos) << result.errors;
        EXPECT_NE(result.errors.find("Not available because the selected disk is not mounted."),
                  std::string::npos)
            << result.errors;
    }
}

}  // namespace
}  // namespace orvane::test
