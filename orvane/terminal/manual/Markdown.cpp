// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/texts/TextColumns.h"
#include "orvane/terminal/manual/Document.h"

#include <algorithm>
#include <utility>

namespace orvane::manual {
namespace {

/// "[words](where)" begins here: the words, and `text` goes on after it.
bool takeLink(std::string_view& text, std::string& words)
{
    const std::size_t middle = text.find("](");
    const std::size_t end = middle == std::string_view::npos ? middle : text.find(')', middle);
    if (!text.starts_with('[') || end == std::string_view::npos || text.find('[', 1) < middle)
        return false;
    words += text.substr(1, middle - 1);
    text.remove_prefix(end + 1);
    return true;
}

Spans spansOf(std::string_view text)
{
    Spans spans{{}};
    while (!text.empty()) {
        const std::string_view mark = text.starts_with('`')    ? "`"
                                      : text.starts_with("**") ? "**"
                                                               : "";
        const std::size_t end =
            mark.empty() ? std::string_view::npos : text.find(mark, mark.size());
        if (end != std::string_view::npos) {
            spans.push_back({mark == "`" ? Span::Look::Verbatim : Span::Look::Bold,
                             std::string(text.substr(mark.size(), end - mark.size()))});
            spans.emplace_back();
            text.remove_prefix(end + mark.size());
        } else if (!takeLink(text, spans.back().text)) {
            // "\|" in a table.
            if (text.size() > 1 && text.front() == '\\')
                text.remove_prefix(1);
            spans.back().text += text.front();
            text.remove_prefix(1);
        }
    }
    std::erase_if(spans, [](const Span& span) { return span.text.empty(); });
    return spans;
}

std::string trimmed(std::string_view text)
{
    const std::size_t begin = text.find_first_not_of(' ');
    const std::size_t end = text.find_last_not_of(' ');
    return begin == std::string_view::npos ? "" : std::string(text.substr(begin, end - begin + 1));
}

/// "| a | b |": the cells, of which all but the first are one.
Block rowOf(std::string_view line)
{
    const std::size_t middle = line.find(" | ");
    const std::size_t end = line.rfind('|');
    Block row{Block::Kind::Row, spansOf(trimmed(line.substr(1, middle - 1)))};
    if (middle != std::string_view::npos && end > middle + 1)
        row.explanation = spansOf(trimmed(line.substr(middle + 3, end - middle - 3)));
    return row;
}

class MarkdownReader {
public:
    Document read(std::string_view text)
    {
        while (!text.empty()) {
            const std::size_t end = std::min(text.find('\n'), text.size());
            take(text.substr(0, end));
            text.remove_prefix(std::min(end + 1, text.size()));
        }
        endBlock();
        return std::move(page_);
    }

private:
    void take(std::string_view line)
    {
        using Kind = Block::Kind;
        if (line.starts_with("```")) {
            endBlock();
            isExample_ = !isExample_;
            kind_ = isExample_ ? Kind::Example : Kind::Paragraph;
        } else if (isExample_) {
            gathered_ += std::string(line) + "\n";
        } else if (line.empty()) {
            endBlock();
        } else if (line.starts_with('#')) {
            endBlock();
            const std::string words = trimmed(line.substr(line.find_first_not_of('#')));
            if (line.starts_with("# "))
                page_.title = wordsOf(spansOf(words));
            else
                page_.blocks.push_back({Kind::Heading, spansOf(words)});
        } else if (line.starts_with('|')) {
            endBlock();
            takeRow(line);
        } else {
            if (line.starts_with("* ") || line.starts_with("- ")) {
                endBlock();
                kind_ = Kind::Item;
                line.remove_prefix(2);
            }
            gathered_ += std::string(line) + "\n";
        }
    }

    // The line below a table's heads turns them into heads: they say what the columns are.
    void takeRow(std::string_view line)
    {
        if (line.find_first_not_of("|-: ") != std::string_view::npos)
            page_.blocks.push_back(rowOf(line));
        else if (!page_.blocks.empty())
            page_.blocks.pop_back();
    }

    void endBlock()
    {
        const std::string text =
            isExample_ ? std::exchange(gathered_, {}) : trimmed(joinedLines(gathered_));
        gathered_.clear();
        const Block::Kind kind = std::exchange(kind_, Block::Kind::Paragraph);
        if (text.empty())
            return;
        if (isExample_)
            page_.blocks.push_back({kind, {{Span::Look::Verbatim, text}}});
        else
            page_.blocks.push_back({kind, spansOf(text), {}, kind == Block::Kind::Item ? "•" : ""});
    }

    Document page_;
    Block::Kind kind_ = Block::Kind::Paragraph;
    std::string gathered_;
    bool isExample_ = false;
};

}  // namespace

Document readMarkdown(std::string_view text)
{
    return MarkdownReader().read(text);
}

}  // namespace orvane::manual
