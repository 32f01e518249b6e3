// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace orvane::manual {

/// A stretch of text with one look. Verbatim: what is typed, or stands somewhere letter for letter.
struct Span {
    enum class Look { Plain, Bold, Verbatim };
    Look look = Look::Plain;
    std::string text;

    friend bool operator==(const Span&, const Span&) = default;
};

using Spans = std::vector<Span>;

/// Without its looks.
std::string wordsOf(const Spans& spans);

/// One paragraph of a page.
struct Block {
    enum class Kind {
        Heading,
        Subheading,
        Paragraph,
        Item,  ///< of a list; `mark` is its bullet or its number
        Term,  ///< a line that the definition below it explains
        Definition,
        Row,      ///< `text`, and `explanation` beside it
        Example,  ///< lines to be kept as they are
    };
    Kind kind = Kind::Paragraph;
    Spans text;
    Spans explanation = {};
    std::string mark = {};  ///< of a heading: the name by which it is found

    friend bool operator==(const Block&, const Block&) = default;
};

/// A page of the manual, apart from how it is written or shown.
struct Document {
    std::string title;
    std::vector<Block> blocks;
    std::vector<std::string> links = {};  ///< to other pages, by their names, each once
};

/// A page of HTML as the help book has them: of the marks that its pages use, the meaning is taken;
/// any other stays in the text, letter for letter.
Document readHelpPage(std::string_view html);

/// Markdown as the project's documents are written: headings, paragraphs, lists, tables of two
/// columns, blocks of code, **strong** and `verbatim` words. Links are their words.
Document readMarkdown(std::string_view text);

}  // namespace orvane::manual
