// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/files/ActivityLog.h"
#include "tests/support/TestDirectory.h"

#include <gtest/gtest.h>

namespace orvane {
namespace {

using test::contentsOf;
using test::TestDirectory;

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
