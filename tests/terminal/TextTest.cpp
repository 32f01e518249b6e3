// SPDX-License-Identifier: Apache-2.0
#include "contract/foundation/UTF8.h"
#include "orvane/terminal/CommandLine.h"
#include "orvane/terminal/TerminalText.h"
#include "tests/terminal/ProgramTest.h"

#include <clocale>
#include <cwchar>

namespace orvane {
namespace {

using test::holdsControls;
using test::linesOf;

/// Widths of characters are the locale's to know.
class TerminalTextTest : public ::testing::Test {
protected:
    void SetUp() override { ASSERT_NE(std::setlocale(LC_CTYPE, "C.UTF-8"), nullptr); }
};

std::size_t widthOf(std::string_view text)
{
    std::size_t columns = 0;
    while (!text.empty())
        columns += static_cast<std::size_t>(
            std::max(0, ::wcwidth(static_cast<wchar_t>(contract::takeCharacter(text)))));
    return columns;
}

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
    JobProgress progress;
    progress.status = "Überprüfe „日本\x1b[2J“";
    for (const std::optional<double> percent :
         {std::optional<double>(), {0.0}, {33.3}, {100.0}, {-5.0}, {400.0}, {0.0 / 1e300}})
        for (const int seconds : {0, 59, 60, 3600, 360'000}) {
            progress.percent = percent;
            progress.elapsed = std::chrono::seconds(seconds);
            for (std::size_t columns = 0; columns < 90; ++columns) {
                const std::string line = progressLine(progress, columns);
                EXPECT_LE(widthOf(line), columns) << line;
                EXPECT_FALSE(holdsControls(line)) << line;
            }
        }
}

TEST_F(TerminalTextTest, ABarGrowsWithThePercentage)
{
    const auto cells = [](double percent) {
        return test::countOf("█", progressLine({percent, "", {}}, 80));
    };
    EXPECT_EQ(cells(0), 0U);
    EXPECT_EQ(cells(50), 12U);
    EXPECT_EQ(cells(100), 24U);
    EXPECT_EQ(cells(1000), 24U);
    EXPECT_EQ(cells(-1), 0U);
    EXPECT_NE(progressLine({}, 80).find("0:00"), std::string::npos) << "no invented percentage";
    EXPECT_EQ(progressLine({}, 80).find('%'), std::string::npos);
}

contract::StyledText styled(std::string_view text, contract::Color color)
{
    contract::TextStyle style;
    style.color = color;
    return contract::StyledText::make(text, style);
}

TEST_F(TerminalTextTest, HostileTextIsMadeHarmless)
{
    for (const std::string_view text : {"\x1b[2Jx", "a\rb", "a\bb", "\x07",
                                        "\xc2\x9b"
                                        "2J",
                                        "\xff\xfe", "a\x7f", "\x1b]0;t\x07"}) {
        const auto plain = contract::StyledText::make(text, {});
        EXPECT_FALSE(holdsControls(terminalText(plain, false))) << text;
        EXPECT_FALSE(holdsControls(terminalText(plain, true))) << "a text without a look";
        EXPECT_FALSE(holdsControls(safeLines(text))) << text;
    }
    EXPECT_EQ(safeLines("a\nb\n"), "a\nb\n");
    EXPECT_EQ(safeLines("\n\na"), "\n\na");
}

TEST_F(TerminalTextTest, TheLookEndsBeforeTheLineDoes)
{
    constexpr std::string_view reset = "\x1b[0m";
    const auto text = styled("one\n\ntwo \x1b[2J\nthree", {1, 0, 0, 1});
    const std::string colored = terminalText(text, true);
    const std::vector<std::string> lines = linesOf(colored);
    ASSERT_EQ(lines.size(), 4U) << colored;
    for (const std::size_t full : {0, 2, 3}) {
        EXPECT_TRUE(lines[full].starts_with("\x1b[31m")) << lines[full];
        EXPECT_TRUE(lines[full].ends_with(reset)) << lines[full];
        EXPECT_EQ(test::countOf("\x1b", lines[full]), 2U) << lines[full];
    }
    EXPECT_EQ(lines[1], "") << "an empty line needs no look";
    EXPECT_EQ(terminalText(styled("ok", {0, 1, 0, 1}), true), "\x1b[32mok\x1b[0m");
    EXPECT_EQ(terminalText(text, false).find("\x1b"), std::string::npos);
}

TEST(ByteCount, HasAtMostThreeDigits)
{
    struct Case {
        std::uint64_t bytes;
        std::string_view text;
    };
    for (const Case& c :
         {Case{0, "0 B"}, Case{1, "1 B"}, Case{512, "512 B"}, Case{999, "999 B"},
          Case{1023, "1.0 KiB"}, Case{1024, "1 KiB"}, Case{1536, "1.5 KiB"},
          Case{10 * 1024, "10 KiB"}, Case{999 * 1024, "999 KiB"}, Case{1000 * 1024, "1.0 MiB"},
          Case{1048576, "1 MiB"}, Case{8388608, "8 MiB"}, Case{40ULL << 30, "40 GiB"},
          Case{3ULL << 39, "1.5 TiB"}, Case{~0ULL, "16 EiB"}}) {
        EXPECT_EQ(byteCount(c.bytes), c.text) << c.bytes;
    }
    for (std::uint64_t bytes = 1; bytes < (1ULL << 62); bytes += bytes / 3 + 1) {
        const std::string text = byteCount(bytes);
        const auto digits =
            std::count_if(text.begin(), text.end(), [](char c) { return c >= '0' && c <= '9'; });
        EXPECT_LE(digits, 3) << bytes << " is " << text;
    }
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
