// SPDX-License-Identifier: Apache-2.0
#include "orvane/terminal/CommandLine.h"
#include "orvane/terminal/Reporter.h"
#include "orvane/terminal/TerminalText.h"
#include "tests/terminal/ProgramTest.h"

#include <clocale>

namespace orvane {
namespace {

pellar::Result<Request, Ending> readWords(std::vector<const char*> words)
{
    words.insert(words.begin(), "fixwell");
    return readCommandLine(static_cast<int>(words.size()), words.data(), {});
}

TEST(CommandLine, ARequestIsConfirmedOnDemandOnlyAndMayNameAFileLikeAnOption)
{
    const auto plain = readWords({"repair", "--", "--yes"});
    ASSERT_TRUE(plain);
    EXPECT_FALSE(plain->confirms);
    EXPECT_EQ(plain->disks, std::vector<std::string>{"--yes"});
    const auto confirmed = readWords({"--color", "never", "repair", "a", "--yes", "LABEL=x y"});
    ASSERT_TRUE(confirmed);
    EXPECT_TRUE(confirmed->confirms);
    EXPECT_EQ(confirmed->disks, (std::vector<std::string>{"a", "LABEL=x y"}));
}

TEST(CommandLine, WhatIsNotUnderstoodIsNamedAndNotObeyed)
{
    struct Case {
        std::vector<const char*> words;
        std::string_view names;
        std::string_view because;
    };
    for (const Case& c :
         {Case{{}, "command", "no command"},
          Case{{"check", "a"}, "“check”", "no such command"},
          Case{{"verfy", "a"}, "mean “verify”", "nearly one"},
          Case{{"verify"}, "DISK", "what?"},
          Case{{"history", "--clear"}, "DISK", "whose?"},
          Case{{"verify", "--clear", "a"},
               "“verify” has no option “--clear”",
               "only a history is cleared"},
          Case{{"verify", "--claer=x"}, "“--claer”", "before what is missing"},
          Case{{"--clear"}, "“--clear”", "of no command"},
          Case{{"verify", "--detials", "a"}, "mean “--details”", "nearly one"},
          Case{{"attach"}, "IMAGE", "what?"},
          Case{{"help", "a", "b"}, "“b”", "one at a time"},
          Case{{"mount", "--read-only", "a"}, "“--read-only”", "only an image is attached so"},
          Case{{"verify", "--color=--trace", "a"},
               "“--color” cannot be “--trace”; it is one of: auto",
               "no such choice"},
          Case{{"verify", "a", "--color"}, "“--color”", "none at all"},
          Case{{"verify", "--json=x", "a"}, "“--json”", "not to be chosen"},
          Case{{"verify", "--log-level=loud", "a"}, "“--log-level”", "no number"},
          Case{{"verify", "--log-level=9", "a"}, "“--log-level”", "out of range"},
          Case{{"verify", "--preview", "a"}, "“--preview”", "writes nothing anyway"},
          Case{{"repair", "--preview", "--direct", "a"},
               "“--preview” and “--direct”",
               "both writing and not"},
          Case{{"repair", "--preview", "--apply-unproven", "a"},
               "“--apply-unproven”",
               "nothing is applied"},
          Case{{"repair", "--preview", "--no-undo", "a"}, "“--no-undo”", "nothing is to be undone"},
          Case{{"repair", "--keep", "f", "a"},
               "“--keep” goes with “--preview”",
               "only a preview's is kept"},
          Case{{"repair", "--preview", "--keep", "f", "a", "b"}, "--keep", "one file, two volumes"},
          Case{{"report", "--json", "a"}, "report --json", "for people"},
          Case{{"undo", "--preview", "a"}, "“--preview”", "of repairs"},
          Case{{"finish"}, "DISK", "what?"},
          Case{{"verify", "--f\x1b[2Jast", "a"}, "--f", "an option with escapes"},
          Case{{"\x1b]0;title\x07"}, "title", "a command with escapes"}}) {
        const auto read = readWords(c.words);
        ASSERT_FALSE(read) << c.because;
        EXPECT_EQ(read.error().status, 16) << c.because;
        EXPECT_NE(read.error().text.find(c.names), std::string::npos) << read.error().text;
        EXPECT_EQ(test::linesOf(read.error().text).size(), 2U) << read.error().text;
        EXPECT_FALSE(test::holdsControls(read.error().text)) << c.because;
    }
}

TEST(GivenNames, APartGoesByTheNameOfItsImage)
{
    GivenNames names;
    names.add("/tmp/a.img", "a.img");
    names.add("/tmp/a.img#odd", "odd");
    names.add("/dev/sdb", "LABEL=x");
    struct Case {
        std::string_view identifier;
        std::string_view name;
        std::string_view because;
    };
    for (const Case& c :
         {Case{"/tmp/a.img", "a.img", "as named"}, Case{"/tmp/a.img#0", "a.img", "fills the image"},
          Case{"/tmp/a.img#12", "a.img#12", "a volume"},
          Case{"/tmp/a.img#odd", "odd", "a file of its own"},
          Case{"/tmp/a.img#odd#1", "odd#1", "inside that file"},
          Case{"/tmp/a.img#", "/tmp/a.img#", "another file"},
          Case{"/tmp/a.img#1#2", "/tmp/a.img#1#2", "another file"},
          Case{"/tmp/a.img2", "/tmp/a.img2", "another file"},
          Case{"/dev/sdb", "LABEL=x", "a device"}, Case{"/dev/sdb1", "/dev/sdb1", "not named"}})
        EXPECT_EQ(names.nameOf(c.identifier), c.name) << c.because;
}

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

TEST_F(TerminalTextTest, AWordOfAShellStaysOneWord)
{
    struct Case {
        std::string_view text;
        std::string_view word;
    };
    for (const Case& c :
         {Case{"/dev/sdb1", "/dev/sdb1"}, Case{"LABEL=x y", "'LABEL=x y'"}, Case{"a#1", "'a#1'"},
          Case{"$(reboot);", "'$(reboot);'"}, Case{"it's", "'it'\\''s'"}, Case{"", "''"},
          Case{"-rf", "./-rf"}, Case{"~", "'~'"}})
        EXPECT_EQ(shellWord(c.text), c.word);
    EXPECT_FALSE(holdsControls(shellWord("a\x1b[2J\n\x07")));
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
