// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/files/WholeFile.h"
#include "orvane/support/texts/Language.h"
#include "orvane/terminal/Completion.h"
#include "orvane/terminal/ManualCommands.h"
#include "orvane/terminal/Reporter.h"
#include "orvane/terminal/manual/PlainText.h"

#include <algorithm>
#include <cerrno>
#include <cstdio>

namespace orvane {
namespace {

using manual::Block;
using manual::Document;
using manual::Span;

constexpr std::size_t mostColumns = 100;  // longer lines are hard to read
constexpr std::string_view contents = "index";
constexpr std::size_t longestPage = 1U << 20U;

/// The pages of the window's help, in the first of the languages in force that has each.
class HelpPages {
public:
    explicit HelpPages(std::filesystem::path book) : book_(std::move(book))
    {
        folders_ = languageFolders(currentLanguages());
        folders_.emplace_back("en");
    }

    /// Without a title when there is no such page.
    Document page(std::string_view name) const
    {
        for (const std::string& folder : folders_)
            if (const auto html =
                    readWholeFile(book_ / folder / (std::string(name) + ".html"), longestPage))
                return manual::readHelpPage(*html);
        return {};
    }

    /// As the contents name them.
    std::vector<std::string> names() const { return page(contents).links; }

private:
    std::filesystem::path book_;
    std::vector<std::string> folders_;
};

std::string withCommands(const std::vector<std::string>& topics)
{
    std::string words;
    for (const std::string& topic : topics)
        words += (words.empty() ? "fixwell help " : ", fixwell help ") + topic;
    return words;
}

Document listOf(const manual::CommandTree& tree, const HelpPages& pages, const Translator& texts)
{
    using Kind = Block::Kind;
    Document list;
    const auto add = [&list](Kind kind, std::string text, std::string explanation = {}) {
        Block block{kind, {{Span::Look::Bold, std::move(text)}}};
        if (!explanation.empty())
            block.explanation = {{Span::Look::Plain, std::move(explanation)}};
        list.blocks.push_back(std::move(block));
    };
    add(Kind::Heading, texts.text("Commands"));
    for (const manual::CommandEntry& command : tree.commands)
        add(Kind::Row, command.name, command.text);
    add(Kind::Heading, texts.text("Topics"));
    for (const std::string& name : pages.names())
        add(Kind::Row, name, pages.page(name).title);
    list.blocks.push_back(
        {Kind::Paragraph,
         {{Span::Look::Plain,
           texts.text("“fixwell help NAME” explains one of them, “fixwell --help” "
                      "lists the options.")}}});
    return list;
}

Document withLinks(Document page, const Translator& texts)
{
    if (!page.links.empty())
        page.blocks.push_back(
            {Block::Kind::Paragraph,
             {{Span::Look::Plain, texts.sentence("More: %@", {withCommands(page.links)})}}});
    return page;
}

}  // namespace

pellar::Result<manual::Document, std::string> helpPage(const Request& request,
                                                       const std::filesystem::path& book,
                                                       const Translator& texts)
{
    const manual::CommandTree tree = commandTree(texts);
    if (request.topic.empty() && request.wantsUsage)
        return overviewOf(tree, texts);
    const HelpPages pages(book);
    if (request.topic.empty())
        return listOf(tree, pages, texts);
    if (const manual::CommandEntry* const command = tree.find(request.topic))
        return helpOn(*command, tree, texts);
    std::vector<std::string> topics = pages.names();
    if (std::find(topics.begin(), topics.end(), request.topic) != topics.end())
        return withLinks(pages.page(request.topic), texts);
    for (const manual::CommandEntry& command : tree.commands)
        topics.push_back(command.name);
    const std::vector<std::string> near = manual::nearest(request.topic, topics);
    std::string sentence = texts.sentence("There is no help on “%@”.", {request.topic});
    sentence += " " + (near.empty() ? texts.text("“fixwell help” lists what there is.")
                                    : texts.sentence("Near to it: %@", {withCommands(near)}));
    return sentence;
}

int writePage(const std::string& text, const Translator& texts)
{
    const bool isTaken = std::fwrite(text.data(), 1, text.size(), stdout) == text.size();
    if ((isTaken && std::fflush(stdout) == 0) || errno == EPIPE)
        return exitSound;
    Reporter::writeError(texts.text("not all of the output could be written"));
    return exitUnchecked;
}

int runHelp(const Request& request, const std::filesystem::path& book, const Translator& texts,
            const TerminalLook& look)
{
    const auto page = helpPage(request, book, texts);
    if (!page) {
        Reporter::writeError(page.error());
        return exitUsage;
    }
    return writePage(manual::plainText(*page, {std::min(look.columns, mostColumns), look.colors}),
                     texts);
}

std::optional<int> runCompletion(const std::vector<std::string>& arguments,
                                 const std::filesystem::path& book, const DiskSources& disks,
                                 const Translator& texts)
{
    if (arguments.size() < 2 || arguments[0] != "--complete")
        return std::nullopt;
    const CompletionSources sources{commandTree(texts), [&disks] { return readSystemDisks(disks); },
                                    [&book] {
                                        const HelpPages pages(book);
                                        std::vector<Candidate> topics;
                                        for (const std::string& name : pages.names())
                                            topics.push_back({name, pages.page(name).title});
                                        return topics;
                                    }};
    if (arguments[1] == "bash" && arguments.size() == 4)
        return writePage(bashReply(arguments[2], arguments[3], sources), texts);
    if (arguments[1] == "plain")
        return writePage(plainReply({arguments.begin() + 2, arguments.end()}, sources), texts);
    return std::nullopt;
}

}  // namespace orvane
