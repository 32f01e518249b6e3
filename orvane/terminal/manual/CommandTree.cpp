// SPDX-License-Identifier: Apache-2.0
#include "orvane/terminal/manual/CommandTree.h"

#include <algorithm>
#include <numeric>
#include <utility>

namespace orvane::manual {
namespace {

using Kind = Block::Kind;
using Look = Span::Look;

/// In how many letters the words differ (Levenshtein).
std::size_t distance(std::string_view from, std::string_view to)
{
    std::vector<std::size_t> row(to.size() + 1);
    std::iota(row.begin(), row.end(), 0);
    for (std::size_t i = 0; i < from.size(); ++i) {
        std::size_t diagonal = std::exchange(row[0], i + 1);
        for (std::size_t j = 0; j < to.size(); ++j) {
            const std::size_t swapped = diagonal + (from[i] == to[j] ? 0 : 1);
            diagonal = row[j + 1];
            row[j + 1] = std::min({swapped, row[j] + 1, diagonal + 1});
        }
    }
    return row.back();
}

Block heading(const Translator& texts, std::string_view key)
{
    return {Kind::Heading, {{Look::Bold, texts.text(key)}}};
}

void append(std::vector<Block>& blocks, std::vector<Block> more)
{
    std::move(more.begin(), more.end(), std::back_inserter(blocks));
}

/// "Usage: fixwell repair …"
Block usageLine(const std::string& words, const Translator& texts)
{
    return {Kind::Paragraph, {{Look::Plain, texts.sentence("Usage: %@", {words})}}};
}

}  // namespace

std::string OptionEntry::usage(const Translator& texts) const
{
    const std::string names = shortName.empty() ? name : shortName + ", " + name;
    if (value.empty())
        return names;
    return names + " " + (choicesOf(value).empty() ? texts.text(value) : value);
}

std::string CommandEntry::usage(const Translator& texts) const
{
    std::string words = name;
    if (!options.empty())
        words += " [" + texts.text("OPTION") + "…]";
    for (const ArgumentEntry& argument : arguments) {
        const std::string all = texts.text(argument.name) + (argument.isMany ? "…" : "");
        words += argument.isRequired ? " " + all : " [" + all + "]";
    }
    return words;
}

const CommandEntry* CommandTree::find(std::string_view command) const
{
    const auto found =
        std::find_if(commands.begin(), commands.end(),
                     [&](const CommandEntry& entry) { return entry.name == command; });
    return found == commands.end() ? nullptr : &*found;
}

std::vector<std::string> choicesOf(std::string_view value)
{
    std::vector<std::string> choices;
    if (value.find('|') == std::string_view::npos)
        return choices;
    while (!value.empty()) {
        const std::size_t end = std::min(value.find('|'), value.size());
        choices.emplace_back(value.substr(0, end));
        value.remove_prefix(std::min(end + 1, value.size()));
    }
    return choices;
}

std::vector<Block> rowsOf(const std::vector<OptionEntry>& options, const Translator& texts)
{
    std::vector<Block> rows;
    for (const OptionEntry& option : options)
        rows.push_back(
            {Kind::Row, {{Look::Verbatim, option.usage(texts)}}, {{Look::Plain, option.text}}});
    return rows;
}

Document overviewOf(const CommandTree& tree, const Translator& texts)
{
    Document page;
    page.blocks.push_back({Kind::Paragraph, {{Look::Plain, tree.text}}});
    page.blocks.push_back(usageLine(
        tree.name + " " + texts.text("COMMAND") + " [" + texts.text("OPTION") + "…] …", texts));
    page.blocks.push_back(heading(texts, "Commands"));
    for (const CommandEntry& command : tree.commands)
        page.blocks.push_back(
            {Kind::Row, {{Look::Verbatim, command.name}}, {{Look::Plain, command.text}}});
    page.blocks.push_back(heading(texts, "Options of all commands"));
    append(page.blocks, rowsOf(tree.options, texts));
    page.blocks.push_back({Kind::Paragraph, {{Look::Plain, tree.footer}}});
    return page;
}

Document helpOn(const CommandEntry& command, const CommandTree& tree, const Translator& texts)
{
    Document page;
    page.blocks.push_back(
        {Kind::Paragraph, {{Look::Plain, texts.sentence("%@.", {command.text})}}});
    page.blocks.push_back(usageLine(tree.name + " " + command.usage(texts), texts));
    for (const ArgumentEntry& argument : command.arguments)
        page.blocks.push_back({Kind::Row,
                               {{Look::Verbatim, texts.text(argument.name)}},
                               {{Look::Plain, argument.text}}});
    if (!command.options.empty()) {
        page.blocks.push_back(heading(texts, "Options"));
        append(page.blocks, rowsOf(command.options, texts));
    }
    page.blocks.push_back(heading(texts, "Options of all commands"));
    append(page.blocks, rowsOf(tree.options, texts));
    return page;
}

std::vector<std::string> nearest(std::string_view word, const std::vector<std::string>& known)
{
    const auto differences = [word](const std::string& other) {
        return other.starts_with(word) && !word.empty() ? 0 : distance(word, other);
    };
    std::vector<std::string> near;
    for (const std::string& other : known)
        if (differences(other) <= std::max<std::size_t>(1, other.size() / 3))
            near.push_back(other);
    std::ranges::stable_sort(near, {}, differences);
    near.resize(std::min<std::size_t>(near.size(), 3));
    return near;
}

}  // namespace orvane::manual
