// SPDX-License-Identifier: Apache-2.0
#include "orvane/terminal/CommandLine.h"
#include "orvane/terminal/TerminalText.h"
#include "tests/terminal/ProgramTest.h"

#include <clocale>

namespace orvane {
namespace {

using test::holdsControls;

/// Widths of characters are the locale's to know.
class TerminalTextTest : public ::testing::Test {
protected:
    void SetUp() override { ASSERT_NE(std::setlocale(LC_CTYPE, "C.UTF-8"), nullptr); }
};

TEST_F(TerminalTextTest, TextIsCutWhereTheColumnsEnd)
{
    struct Case {
        std::string_view text;
        std::size_t columns;
        std::string_view fitted;
        std::string_view because;
    };
    for (const Case& c :
         {Case{"disk", 4, "disk", "fits"}, Case{"disk", 3, "dis", "is cut"},
          Case{"disk", 0, "", "no room"}, Case{"", 5, "", "nothing"},
          Case{"äöü", 2, "äö", "columns, not bytes"}, Case{"日本", 4, "日本", "two columns each"},
          Case{"日本", 3, "日", "half a character is none"},
          Case{"日本", 1, "", "not even the first"},
          Case{"e\xcc\x81x", 1, "e\xcc\x81", "an accent takes no column"}})
        EXPECT_EQ(fittedTo(c.text, c.columns), c.fitted) << c.because;
}

TEST_F(TerminalTextTest, AProgressLineFitsAnyTerminal)
{
    for (const JobProgress& progress :
         {JobProgress{{}, "Überprüfe „日本\x1b[2J“", std::chrono::hours(100)},
          JobProgress{400.0, "Überprüfe „日本\x1b[2J“", {}}})
        for (std::size_t columns = 0; columns < 90; ++columns) {
            const std::string line = progressLine(progress, columns);
            EXPECT_EQ(fittedTo(line, columns), line);
            EXPECT_FALSE(holdsControls(line)) << line;
        }
}

TEST_F(TerminalTextTest, ABarGrowsWithThePercentage)
{
    for (const auto& [percent, cells] :
         {std::pair{0.0, 0U}, {50.0, 12U}, {100.0, 24U}, {1000.0, 24U}, {-1.0, 0U}})
        EXPECT_EQ(test::countOf("█", progressLine({percent, "", {}}, 80)), cells) << percent;
    EXPECT_NE(progressLine({}, 80).find("0:00"), std::string::npos) << "no invented percentage";
    EXPECT_EQ(progressLine({}, 80).find('%'), std::string::npos);
}

TEST_F(TerminalTextTest, HostileTextIsMadeHarmless)
{
    for (const std::string_view text : {"\x1b[2Jx", "a\rb", "a\bb", "\x07",
                                        "\xc2\x9b"
                                        "2J",
                                        "\xff\xfe", "a\x7f", "\x1b]0;t\x07"}) {
        const auto plain = contract::StyledText::make(text, {});
        for (const bool colors : {false, true})
            EXPECT_FALSE(holdsControls(terminalText(plain, colors))) << text;
        EXPECT_FALSE(holdsControls(safeLines(text))) << text;
    }
    EXPECT_EQ(safeLines("\n\na\n"), "\n\na\n");
}

TEST(ByteCount, HasAtMostThreeDigits)
{
    struct Case {
        std::uint64_t bytes;
        std::string_view text;
    };
    for (const Case& c :
         {Case{0, "0 B"}, Case{999, "999 B"}, Case{1023, "1.0 KiB"}, Case{1024, "1 KiB"},
          Case{1536, "1.5 KiB"}, Case{10 * 1024, "10 KiB"}, Case{1000 * 1024, "1.0 MiB"},
          Case{40ULL << 30, "40 GiB"}, Case{~0ULL, "16 EiB"}})
        EXPECT_EQ(byteCount(c.bytes), c.text) << c.bytes;
}

TEST(ExitStatus, AnUnknownVerdictIsNoSuccess)
{
    struct Case {
        std::string_view verdict;
        int status;
    };
    for (const Case& c : {Case{"sound", 0}, Case{"repaired", 1}, Case{"damaged", 4},
                          Case{"inconclusive", 8}, Case{"failed", 8}, Case{"stopped", 32},
                          Case{"", 8}, Case{"Sound", 8}, Case{"soundly", 8}})
        EXPECT_EQ(exitStatusFor(c.verdict), c.status) << c.verdict;
}

}  // namespace
}  // namespace orvane
