// SPDX-License-Identifier: Apache-2.0
#include "orvane/terminal/manual/ManPage.h"

#include "contract/foundation/UTF8.h"

#include <algorithm>
#include <array>
#include <cctype>
#include <cstdio>

namespace orvane::manual {
namespace {

struct NamedCharacter {
    char32_t character;
    std::string_view name;  ///< groff_char(7)
};

constexpr std::array<NamedCharacter, 8> named{{{U'“', "\\(lq"},
                                               {U'”', "\\(rq"},
                                               {U'‘', "\\(oq"},
                                               {U'’', "\\(cq"},
                                               {U'–', "\\(en"},
                                               {U'•', "\\(bu"},
                                               {U'…', "..."},
                                               {U'\u00A0', "\\ "}}};

std::string characterText(char32_t character)
{
    for (const NamedCharacter& known : named)
        if (known.character == character)
            return std::string(known.name);
    if (character < 0x80)
        return std::string(1, static_cast<char>(character));
    std::array<char, 16> text{};
    std::snprintf(text.data(), text.size(), "\\[u%04X]", static_cast<unsigned>(character));
    return text.data();
}

// What is typed has minus signs (groff_char(7)), elsewhere only an option's dashes are some.
std::string escaped(std::string_view text, bool isVerbatim)
{
    std::string result;
    char32_t before = U' ';
    contract::forEachCharacter(text, [&](char32_t character) {
        const bool beginsWord =
            before == U' ' || before == U'“' || before == U'-' || before == U'(';
        if (character == U'\\')
            result += "\\(rs";
        else if (character == U'-' && (isVerbatim || beginsWord))
            result += "\\-";
        else if (character == U'\'' && isVerbatim)
            result += "\\(aq";
        else
            result += characterText(character);
        before = character;
    });
    return result;
}

std::string inlineText(const Spans& spans)
{
    std::string text;
    for (const Span& span : spans) {
        const std::string words = escaped(span.text, span.look == Span::Look::Verbatim);
        text += span.look == Span::Look::Plain ? words : "\\fB" + words + "\\fR";
    }
    return text;
}

constexpr std::size_t lineLength = 76;

/// A line that begins with one of these is a request (roff(7)).
std::string lineOf(std::string_view words)
{
    const bool isRequest = words.starts_with('.') || words.starts_with('\'');
    return (isRequest ? "\\&" : "") + std::string(words) + "\n";
}

/// At blanks, but not at one that is escaped.
std::string filled(std::string_view text)
{
    std::string result;
    while (!text.empty()) {
        std::size_t end = text.size();
        if (end > lineLength) {
            end = text.rfind(' ', lineLength);
            while (end != std::string_view::npos && end > 0 && text[end - 1] == '\\')
                end = text.rfind(' ', end - 1);
            if (end == std::string_view::npos)
                end = std::min(text.find(' ', lineLength), text.size());
        }
        result += lineOf(text.substr(0, end));
        text.remove_prefix(std::min(end + 1, text.size()));
    }
    return result;
}

std::string example(std::string_view lines)
{
    std::string text = ".RS 4\n.nf\n";
    while (!lines.empty()) {
        const std::size_t end = std::min(lines.find('\n'), lines.size());
        text += lineOf(escaped(lines.substr(0, end), true));
        lines.remove_prefix(std::min(end + 1, lines.size()));
    }
    return text + ".fi\n.RE\n";
}

std::string inCapitals(std::string text)
{
    std::transform(text.begin(), text.end(), text.begin(),
                   [](unsigned char letter) { return static_cast<char>(std::toupper(letter)); });
    return text;
}

std::string blockText(const Block& block, bool isFirst)
{
    using Kind = Block::Kind;
    switch (block.kind) {
        case Kind::Heading: return ".SH " + escaped(inCapitals(wordsOf(block.text)), false) + "\n";
        case Kind::Subheading: return ".SS " + escaped(wordsOf(block.text), true) + "\n";
        case Kind::Paragraph: return (isFirst ? "" : ".PP\n") + filled(inlineText(block.text));
        case Kind::Item:
            return ".IP " + characterText(U'•') + " 2\n" + filled(inlineText(block.text));
        case Kind::Term: return ".TP\n" + lineOf(inlineText(block.text));
        case Kind::Definition: return filled(inlineText(block.text));
        case Kind::Row:
            return ".TP\n" + lineOf(inlineText(block.text)) + filled(inlineText(block.explanation));
        case Kind::Example: return (isFirst ? "" : ".PP\n") + example(wordsOf(block.text));
    }
    return {};
}

}  // namespace

std::string manPage(const ManPageHead& head, const Document& page)
{
    std::string text = ".\\\" Made from the program's own help; changes here are lost.\n.TH " +
                       inCapitals(head.name) + " " + head.section + " " + head.date + " \"" +
                       head.version + "\"\n.SH NAME\n" + head.name + " \\- " +
                       escaped(head.purpose, false) + "\n";
    bool isFirst = false;
    for (const Block& block : page.blocks) {
        text += blockText(block, isFirst);
        isFirst = block.kind == Block::Kind::Heading || block.kind == Block::Kind::Subheading;
    }
    return text;
}

}  // namespace orvane::manual
