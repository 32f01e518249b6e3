// SPDX-License-Identifier: Apache-2.0
#include "orvane/terminal/manual/PlainText.h"

#include "contract/foundation/UTF8.h"
#include "orvane/support/texts/TextColumns.h"

#include <algorithm>
#include <utility>

namespace orvane::manual {
namespace {

constexpr std::size_t longestName = 26;  // of a row, that has its explanation beside it
constexpr std::size_t leastColumns = 20;

using Kind = Block::Kind;

class Layouter {
public:
    explicit Layouter(const TextLayout& layout)
        : layout_{std::max(layout.columns, leastColumns), layout.isBold}
    {
    }

    std::string layOut(const Document& page)
    {
        if (!page.title.empty())
            write({{Span::Look::Bold, page.title}}, 0);
        for (std::size_t i = 0; i < page.blocks.size(); ++i) {
            if (page.blocks[i].kind == Kind::Row &&
                (i == 0 || page.blocks[i - 1].kind != Kind::Row))
                nameColumns_ = columnsOfNames(page.blocks, i);
            if (i > 0 ? isApart(page.blocks[i - 1].kind, page.blocks[i].kind) : !page.title.empty())
                text_ += '\n';
            add(page.blocks[i]);
        }
        return std::move(text_);
    }

private:
    /// Rows, items, and a term and what it means, follow each other closely.
    static bool isApart(Kind before, Kind after)
    {
        return before != Kind::Heading && before != Kind::Subheading &&
               !(before == after && (after == Kind::Row || after == Kind::Item)) &&
               !(before == Kind::Term && after == Kind::Definition);
    }

    static std::size_t columnsOfNames(const std::vector<Block>& blocks, std::size_t first)
    {
        std::size_t widest = 0;
        for (std::size_t i = first; i < blocks.size() && blocks[i].kind == Kind::Row; ++i)
            if (const std::size_t columns = columnsOf(wordsOf(blocks[i].text));
                columns <= longestName)
                widest = std::max(widest, columns);
        return widest;
    }

    void add(const Block& block)
    {
        switch (block.kind) {
            case Kind::Heading:
            case Kind::Subheading: write(inBold(block.text), 0); break;
            case Kind::Paragraph: write(block.text, 0); break;
            case Kind::Item:
                text_ += " " + block.mark + " ";
                column_ = columnsOf(block.mark) + 2;
                write(block.text, column_);
                break;
            case Kind::Term: write(block.text, 0); break;
            case Kind::Definition: write(block.text, 4, indent(4)); break;
            case Kind::Row: addRow(block); break;
            case Kind::Example: addExample(wordsOf(block.text)); break;
        }
    }

    void addRow(const Block& row)
    {
        const std::size_t from = nameColumns_ + 4;
        write(row.text, 4, indent(2));
        if (row.explanation.empty())
            return;
        const std::size_t used = columnsOf(wordsOf(row.text));
        if (used <= nameColumns_) {
            text_.pop_back();
            write(row.explanation, from, std::string(from - 2 - used, ' '), from);
        } else {
            write(row.explanation, from, indent(from));
        }
    }

    void addExample(std::string_view lines)
    {
        while (!lines.empty()) {
            const std::size_t end = std::min(lines.find('\n'), lines.size());
            const std::string_view line = lines.substr(0, end);
            text_ += (line.empty() ? "" : "    ") + contract::printable(line) + "\n";
            lines.remove_prefix(std::min(end + 1, lines.size()));
        }
    }

    static std::string indent(std::size_t columns) { return std::string(columns, ' '); }

    static Spans inBold(Spans spans)
    {
        for (Span& span : spans)
            span.look = Span::Look::Bold;
        return spans;
    }

    void write(const Spans& spans, std::size_t margin, const std::string& begin)
    {
        write(spans, margin, begin, columnsOf(begin));
    }

    /// Filled lines: the first goes on after `begin`, in `column`, the others begin at the margin.
    void write(const Spans& spans, std::size_t margin, const std::string& begin, std::size_t column)
    {
        text_ += begin;
        column_ = column;
        write(spans, margin);
    }

    /// From `column_` on. The look is given up at each line's end, that nothing else gets it.
    void write(const Spans& spans, std::size_t margin)
    {
        Span::Look look = Span::Look::Plain;
        std::size_t pending = 0;  // blanks that are owed
        bool isLineStart = true;
        // A word may go on in the next span, so pieces are put together before they are laid out.
        for (const Spans& word : wordsIn(spans)) {
            const std::string letters = wordsOf(word);
            const std::size_t width =
                columnsOf(letters.substr(0, letters.find_last_not_of(' ') + 1));
            if (!isLineStart && column_ + pending + width > layout_.columns) {
                turn(look, Span::Look::Plain);
                text_ += '\n' + indent(margin);
                column_ = margin;
                pending = 0;
            }
            for (const Span& part : word) {
                if (pending > 0 && look != part.look)
                    turn(look, Span::Look::Plain);
                text_ += indent(pending);
                column_ += std::exchange(pending, 0);
                turn(look, part.look);
                const std::string shown =
                    contract::printable(part.text.substr(0, part.text.find_last_not_of(' ') + 1));
                text_ += shown;
                column_ += columnsOf(shown);
                pending = part.text.size() - (part.text.find_last_not_of(' ') + 1);
            }
            isLineStart = false;
        }
        turn(look, Span::Look::Plain);
        text_ += '\n';
        column_ = 0;
    }

    /// Words with the blanks that end them, each in its spans.
    static std::vector<Spans> wordsIn(const Spans& spans)
    {
        const std::string all = wordsOf(spans);
        std::vector<Spans> words;
        auto span = spans.begin();
        std::size_t taken = 0;  // of that span
        for (std::string_view piece : breakablePieces(all)) {
            Spans word;
            while (!piece.empty()) {
                const std::size_t length = std::min(piece.size(), span->text.size() - taken);
                if (length > 0)
                    word.push_back({span->look, std::string(piece.substr(0, length))});
                piece.remove_prefix(length);
                taken += length;
                if (taken == span->text.size()) {
                    ++span;
                    taken = 0;
                }
            }
            words.push_back(std::move(word));
        }
        return words;
    }

    void turn(Span::Look& from, Span::Look to)
    {
        const bool wasBold = from != Span::Look::Plain;
        const bool isBold = to != Span::Look::Plain;
        if (layout_.isBold && wasBold != isBold)
            text_ += isBold ? "\x1b[1m" : "\x1b[0m";
        from = to;
    }

    const TextLayout layout_;
    std::string text_;
    std::size_t column_ = 0;
    std::size_t nameColumns_ = 0;
};

}  // namespace

std::string plainText(const Document& page, const TextLayout& layout)
{
    return Layouter(layout).layOut(page);
}

}  // namespace orvane::manual
