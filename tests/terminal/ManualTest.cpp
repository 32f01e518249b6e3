// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/texts/Language.h"
#include "orvane/support/texts/TextColumns.h"
#include "orvane/terminal/CommandLine.h"
#include "orvane/terminal/ManualCommands.h"
#include "orvane/terminal/manual/ManPage.h"
#include "orvane/terminal/manual/PlainText.h"
#include "tests/terminal/ProgramTest.h"

#include <clocale>
#include <regex>
#include <set>

namespace orvane::manual {
namespace {

namespace fs = std::filesystem;

std::string withoutBlanks(std::string text)
{
    for (const std::string_view blank : {" ", "\n", "\u00A0"})
        for (std::size_t at = 0; (at = text.find(blank, at)) != std::string::npos;)
            text.erase(at, blank.size());
    return text;
}

/// All that a reader of the page sees, with none of its marks and blanks.
std::string visibleText(const std::string& html)
{
    const std::string body =
        std::regex_replace(html, std::regex("<!--[^]*?-->|<head>[^]*?</head>"), "");
    return withoutBlanks(std::regex_replace(body, std::regex("<[^>]*>"), ""));
}

std::string visibleText(const Document& page)
{
    std::string text = page.title;
    for (const Block& block : page.blocks)
        text += wordsOf(block.text) + wordsOf(block.explanation);
    return withoutBlanks(text);
}

std::vector<fs::path> helpPages()
{
    std::vector<fs::path> pages;
    for (const auto& entry : fs::recursive_directory_iterator(HELP_PAGES))
        if (entry.path().extension() == ".html")
            pages.push_back(entry.path());
    return pages;
}

class ManualTest : public ::testing::Test {
protected:
    void SetUp() override { ASSERT_NE(std::setlocale(LC_CTYPE, "C.UTF-8"), nullptr); }
    void TearDown() override { setLanguage(""); }
};

TEST_F(ManualTest, EveryPageOfTheHelpIsReadToItsLastWordAndWithoutAMark)
{
    const auto pages = helpPages();
    ASSERT_GE(pages.size(), 24U);
    for (const fs::path& file : pages) {
        const std::string html = test::contentsOf(file);
        const Document page = readHelpPage(html);
        EXPECT_EQ(visibleText(page), visibleText(html)) << file;
        EXPECT_FALSE(page.title.empty()) << file;
        for (const std::string& link : page.links)
            EXPECT_TRUE(fs::exists(file.parent_path() / (link + ".html"))) << file << link;
        const std::string bold = plainText(page, {60, true});
        const std::string plain = plainText(page, {60, false});
        EXPECT_EQ(std::regex_replace(bold, std::regex("\x1b\\[[01]m"), ""), plain) << file;
        EXPECT_FALSE(test::holdsControls(plain)) << file;
        for (const std::string& line : test::linesOf(bold))
            EXPECT_EQ(test::countOf("\x1b[1m", line), test::countOf("\x1b[0m", line)) << line;
    }
}

TEST_F(ManualTest, MarksBecomeWhatTheyMean)
{
    const Document page = readHelpPage(
        "<html><head><title>x</title></head><body><h1>T</h1>\n<p>one <b>two\nthree</b>,\nfour "
        "&lt;5&gt; &#228;</p><ol><li>a <code>b</code></li><li>c</li></ol>"
        "<pre>x\n  y</pre><table><tr><td>k</td><td>v <b>w</b></td></tr></table>"
        "<p>ディスク\nを見る</p><p>a <blink>b</blink></p></body></html>");
    EXPECT_EQ(page.title, "T");
    EXPECT_EQ(plainText(page, {}),
              "T\n\none two three, four <5> ä\n\n 1. a b\n 2. c\n\n    x\n      y\n\n  k  v w\n\n"
              "ディスクを見る\n\na <blink>b</blink>\n");
}

TEST_F(ManualTest, LinesEndWhereTheColumnsDo)
{
    const auto linesOf = [](std::string text) {
        return test::linesOf(plainText(
            Document{"", {{Block::Kind::Paragraph, {{{}, std::move(text)}}}}}, {20, false}));
    };
    using Lines = std::vector<std::string>;
    EXPECT_EQ(linesOf("twelve words of a sentence"), (Lines{"twelve words of a", "sentence"}));
    EXPECT_EQ(linesOf("äöüäöüäöüäöüäöüä abc d"), (Lines{"äöüäöüäöüäöüäöüä abc", "d"}));
    EXPECT_EQ(linesOf("a-word-that-is-longer-than-a-line b"),
              (Lines{"a-word-that-is-longer-than-a-line", "b"}));
    EXPECT_EQ(linesOf("日本語の文章は空白なしで続く。"),
              (Lines{"日本語の文章は空白な", "しで続く。"}));
    EXPECT_EQ(linesOf("日本語の文章は空白な。続く"), (Lines{"日本語の文章は空白", "な。続く"}))
        << "a full stop never begins a line";
    Document rows;
    for (const char* const name : {"a", "longer"})
        rows.blocks.push_back({Block::Kind::Row, {{{}, name}}, {{{}, "some words"}}});
    EXPECT_EQ(plainText(rows, {20, false}), "  a       some words\n  longer  some words\n");
    EXPECT_EQ(test::linesOf(plainText(rows, {1, false})).size(), 2U) << "no columns to speak of";
}

TEST_F(ManualTest, NearestNamesComeFirstAndStrangersNotAtAll)
{
    const std::vector<std::string> known{"verify", "repair", "verify-permissions", "undo",
                                         "report"};
    EXPECT_EQ(nearest("repiar", known), (std::vector<std::string>{"repair"}));
    EXPECT_EQ(nearest("ver", known), (std::vector<std::string>{"verify", "verify-permissions"}));
    EXPECT_EQ(nearest("xyz", known), std::vector<std::string>());
    EXPECT_EQ(nearest("", known), std::vector<std::string>());
}

TEST_F(ManualTest, WhatIsSaidIsNoRequestOfTheManualsFormatter)
{
    const auto body = [](const Block& block) {
        const std::string page = manPage({"x", "1", "y", "z", "d"}, {"", {block}});
        return page.substr(page.find("y\n") + 2);
    };
    using Look = Span::Look;
    EXPECT_EQ(body({Block::Kind::Paragraph, {{Look::Plain, ".so /etc/passwd"}}}),
              ".PP\n\\&.so /etc/passwd\n");
    EXPECT_EQ(body({Block::Kind::Paragraph, {{Look::Plain, "a\\*b – “c” ä"}}}),
              ".PP\na\\(rs*b \\(en \\(lqc\\(rq \\[u00E4]\n");
    EXPECT_EQ(
        body({Block::Kind::Row, {{Look::Verbatim, "--a-b"}}, {{Look::Plain, "well-known -x"}}}),
        ".TP\n\\fB\\-\\-a\\-b\\fR\nwell-known \\-x\n");
    EXPECT_EQ(body({Block::Kind::Example, {{Look::Verbatim, "'a\n.b\n"}}}),
              ".PP\n.RS 4\n.nf\n\\(aqa\n\\&.b\n.fi\n.RE\n");
    for (const std::string& line : test::linesOf(body(
             {Block::Kind::Paragraph,
              {{Look::Plain, "a" + std::string(200, ' ') + ".b" + std::string(80, '.') + " .c"}}})))
        EXPECT_FALSE(line.starts_with('.') && line != ".PP") << line;
}

TEST_F(ManualTest, MarkdownIsReadAsItIsMeant)
{
    const Document page = readMarkdown(
        "# The `x`\n\nSome **strong** [words](y.md),\nand `a|b`.\n\n"
        "| h | i |\n|---|---|\n| `k` | v \\| w |\n\n* one\n* two\n"
        "\n## More\n\n```\nz  z\n```\n");
    EXPECT_EQ(page.title, "The x");
    EXPECT_EQ(
        plainText(page, {}),
        "The x\n\nSome strong words, and a|b.\n\n  k  v | w\n\n • one\n • two\n\nMore\n    z  z\n");
}

TEST_F(ManualTest, EveryPageOfTheManualIsCompleteAndFormatsWithoutAWarning)
{
    struct Case {
        std::string_view file;
        std::vector<std::string_view> sections;
    };
    const bool hasFormatter = test::runTool({"groff", "--version"}).status == 0;
    for (const Case& c : {Case{"man1/fixwell.1",
                               {"NAME", "SYNOPSIS", "DESCRIPTION", "COMMANDS", "OPTIONS",
                                "EXAMPLES", "EXIT STATUS", "ENVIRONMENT", "FILES", "SEE ALSO"}},
                          Case{"man1/orvane.1",
                               {"NAME", "SYNOPSIS", "DESCRIPTION", "OPTIONS", "EXIT STATUS",
                                "ENVIRONMENT", "FILES", "SEE ALSO"}},
                          Case{"man5/fixwell-json.5", {"NAME", "DESCRIPTION", "SEE ALSO"}},
                          Case{"man8/pellar-helper.8",
                               {"NAME", "SYNOPSIS", "DESCRIPTION", "OPTIONS", "EXIT STATUS",
                                "FILES", "SEE ALSO"}}}) {
        const fs::path file = fs::path(MANUAL_PAGES) / c.file;
        const std::string page = test::contentsOf(file);
        std::size_t at = 0;
        for (const std::string_view section : c.sections) {
            const std::size_t found = page.find(".SH " + std::string(section) + "\n", at);
            ASSERT_NE(found, std::string::npos) << c.file << ": " << section << ", in this order";
            at = found;
        }
        EXPECT_EQ(std::count_if(page.begin(), page.end(), [](char byte) { return byte < 0; }), 0);
        if (!hasFormatter)
            continue;
        const auto formatted = test::runTool({"groff", "-man", "-ww", "-Tascii", "-z", file});
        EXPECT_EQ(formatted.status, 0) << c.file;
        EXPECT_EQ(formatted.output, "") << c.file;
    }
    if (!hasFormatter)
        GTEST_SKIP() << "the pages are complete; groff, which would format them, is not installed";
}

using VersionTest = test::ProgramTest;

TEST_F(VersionTest, TheProgramAndEveryToolAreTold)
{
    useTool("say e2fsck 9.8.7 (1-Jan-2026)\nexit 0");
    environment_["LANG"] = "C.UTF-8";
    environment_["LANGUAGE"] = "de";
    const test::RunResult result = run({"--version"});
    EXPECT_EQ(result.status, 0) << result.errors;
    const auto lines = test::linesOf(result.output);
    ASSERT_EQ(lines.size(), 8U) << result.output;
    EXPECT_EQ(lines[0], "fixwell " PROJECT_VERSION);
    EXPECT_EQ(lines[1].substr(0, 8), "  e2fsck");
    EXPECT_NE(lines[1].find("9.8.7"), std::string::npos);
    for (const std::string& line : lines)
        EXPECT_EQ(line.find("not installed"), std::string::npos) << "in German";
}

TEST_F(VersionTest, AToolThatIsMissingIsToldWithItsPackage)
{
    testing::internal::CaptureStdout();
    EXPECT_EQ(runVersion("/no/such/place", {}, {}), 0);
    const auto lines = test::linesOf(testing::internal::GetCapturedStdout());
    ASSERT_EQ(lines.size(), 8U);
    for (std::size_t i = 1; i < lines.size(); ++i)
        EXPECT_NE(lines[i].find("not installed: package "), std::string::npos) << lines[i];
    EXPECT_TRUE(lines[1].ends_with("e2fsprogs")) << lines[1];
}

/// Everything that the command line says, in the words by which a translation is looked for.
std::set<std::string> wordsOfTheCommandLine()
{
    std::set<std::string> asked;
    Translator recorder;
    recorder.text = [&asked](std::string_view key) {
        asked.emplace(key);
        return std::string(key);
    };
    Request request;
    std::vector<std::vector<const char*>> lines{{},
                                                {"verfy"},
                                                {"-x"},
                                                {"verify"},
                                                {"verify", "--f"},
                                                {"help", "a", "b"},
                                                {"verify", "--json=x", "a"},
                                                {"verify", "--color"},
                                                {"verify", "--color=x", "a"},
                                                {"repair", "--keep", "f", "a"},
                                                {"repair", "--preview", "--direct", "a"},
                                                {"repair", "--preview", "--keep", "f", "a", "b"},
                                                {"report", "--json", "a"}};
    for (auto& words : lines) {
        words.insert(words.begin(), "fixwell");
        EXPECT_FALSE(readCommandLine(static_cast<int>(words.size()), words.data(), recorder));
    }
    for (const char* const topic : {"", "no-such-topic", "repar", "keys"}) {
        request.topic = topic;
        static_cast<void>(helpPage(request, HELP_PAGES, recorder));
    }
    const CommandTree tree = commandTree(recorder);
    static_cast<void>(overviewOf(tree, recorder));
    for (const CommandEntry& command : tree.commands)
        static_cast<void>(helpOn(command, tree, recorder));
    return asked;
}

TEST_F(ManualTest, EveryLanguageHasAllWordsOfTheCommandLine)
{
    const auto asked = wordsOfTheCommandLine();
    ASSERT_GT(asked.size(), 60U);
    const fs::path locale = HOST_LOCALE;
    const Catalogue catalogue(locale);
    for (const auto& entry : fs::directory_iterator(locale)) {
        setLanguage(entry.path().filename());
        for (const std::string& key : asked)
            EXPECT_TRUE(catalogue.find("Orvane", key)) << entry.path().filename() << ": " << key;
    }
}

}  // namespace
}  // namespace orvane::manual
