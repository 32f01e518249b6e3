// SPDX-License-Identifier: Apache-2.0

// Writes the pages of the manual, at build time: "make-manual DIRECTORY SOURCES DATE". SOURCES is
// the top of the project. What the program's help says stands there as well; nothing is said twice.

#include "orvane/support/ProgramStart.h"
#include "orvane/terminal/CommandLine.h"
#include "orvane/terminal/manual/ManPage.h"

#include <algorithm>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <stdexcept>

namespace orvane::manual {
namespace {

namespace fs = std::filesystem;
using Kind = Block::Kind;

std::string contentsOf(const fs::path& file)
{
    std::ifstream stream(file, std::ios::binary);
    std::string text{std::istreambuf_iterator<char>(stream), {}};
    if (!stream || text.empty())
        throw std::runtime_error("cannot read " + file.string());
    return text;
}

void writeNew(const fs::path& file, const std::string& text)
{
    fs::create_directories(file.parent_path());
    std::ofstream stream(file, std::ios::binary | std::ios::trunc);
    stream << text;
    stream.close();
    if (!stream)
        throw std::runtime_error("cannot write " + file.string());
}

void append(Document& page, const Document& more)
{
    page.blocks.insert(page.blocks.end(), more.blocks.begin(), more.blocks.end());
}

Block heading(std::string words)
{
    return {Kind::Heading, {{Span::Look::Bold, std::move(words)}}};
}

/// The sections of a page of the help: what stands before the first is the page's own introduction.
Document sectionsOf(Document page)
{
    const auto first = std::find_if(page.blocks.begin(), page.blocks.end(),
                                    [](const Block& block) { return block.kind == Kind::Heading; });
    page.blocks.erase(page.blocks.begin(), first);
    return page;
}

/// Takes the page apart at a heading: it, and what follows it, are the second part.
Document splitAt(Document& page, std::string_view words)
{
    const auto at = std::find_if(page.blocks.begin(), page.blocks.end(), [&](const Block& block) {
        return block.kind == Kind::Heading && wordsOf(block.text) == words;
    });
    Document rest;
    rest.blocks.assign(at, page.blocks.end());
    page.blocks.erase(at, page.blocks.end());
    return rest;
}

Document commandsOf(const CommandTree& tree, const Translator& texts)
{
    Document page;
    page.blocks.push_back(heading("Commands"));
    for (const CommandEntry& command : tree.commands) {
        page.blocks.push_back({Kind::Subheading, {{Span::Look::Verbatim, command.usage(texts)}}});
        page.blocks.push_back({Kind::Paragraph, {{Span::Look::Plain, command.text + "."}}});
        for (const Block& row : rowsOf(command.options, texts))
            page.blocks.push_back(row);
    }
    page.blocks.push_back(heading("Options"));
    for (const Block& row : rowsOf(tree.options, texts))
        page.blocks.push_back(row);
    return page;
}

/// Its own words, then what the parser knows and what the help says, and at the end where to go on.
Document pageOfFixwell(const fs::path& sources)
{
    const Translator english;
    Document page = readHelpPage(contentsOf(sources / "orvane/resources/manual/fixwell.html"));
    const Document end = splitAt(page, "See also");
    append(page, commandsOf(commandTree(english), english));
    append(page, sectionsOf(
                     readHelpPage(contentsOf(sources / "orvane/resources/help/en/terminal.html"))));
    append(page, end);
    return page;
}

Document pageOfEvents(const fs::path& sources)
{
    Document page{"events of fixwell for other programs", {heading("Description")}};
    append(page, readMarkdown(contentsOf(sources / "docs/json.md")));
    page.blocks.push_back(heading("See also"));
    page.blocks.push_back({Kind::Paragraph, {{Span::Look::Verbatim, "fixwell"}, {{}, "(1)"}}});
    return page;
}

void makeAll(const fs::path& directory, const fs::path& sources, const std::string& date)
{
    const auto make = [&](const std::string& name, const std::string& section,
                          const Document& page) {
        const ManPageHead head{name, section, page.title, "Orvane " + std::string(programVersion()),
                               date};
        writeNew(directory / ("man" + section) / (name + "." + section), manPage(head, page));
    };
    const auto ownPage = [&](const std::string& name) {
        return readHelpPage(contentsOf(sources / "orvane/resources/manual" / (name + ".html")));
    };
    make("fixwell", "1", pageOfFixwell(sources));
    make("orvane", "1", ownPage("orvane"));
    make("pellar-helper", "8", ownPage("pellar-helper"));
    make("fixwell-json", "5", pageOfEvents(sources));
}

}  // namespace
}  // namespace orvane::manual

int main(int argc, char** argv)
{
    try {
        if (argc != 4)
            throw std::runtime_error("usage: make-manual DIRECTORY SOURCES DATE");
        orvane::manual::makeAll(argv[1], argv[2], argv[3]);
        return 0;
    } catch (const std::exception& error) {
        std::fprintf(stderr, "make-manual: %s\n", error.what());
        return 1;
    }
}
