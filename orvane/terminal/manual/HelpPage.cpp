// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/texts/TextColumns.h"
#include "orvane/terminal/manual/Document.h"

#include "contract/foundation/UTF8.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <optional>
#include <utility>

namespace orvane::manual {
namespace {

struct Entity {
    std::string_view name;
    std::string_view text;
};

constexpr std::array<Entity, 6> entities{
    {{"amp", "&"}, {"lt", "<"}, {"gt", ">"}, {"quot", "\""}, {"apos", "'"}, {"nbsp", "\u00A0"}}};

std::string decoded(std::string_view name)
{
    for (const Entity& entity : entities)
        if (entity.name == name)
            return std::string(entity.text);
    unsigned number = 0;
    const bool isHexadecimal = name.starts_with("#x");
    const std::string_view digits = name.substr(std::min(name.size(), isHexadecimal ? 2UL : 1UL));
    std::string text;
    if (name.starts_with('#') &&
        std::from_chars(digits.data(), digits.data() + digits.size(), number,
                        isHexadecimal ? 16 : 10)
                .ec == std::errc() &&
        number <= 0x10FFFF)
        contract::appendUTF8(text, static_cast<char32_t>(number));
    return text.empty() ? "&" + std::string(name) + ";" : text;
}

std::string withoutEntities(std::string_view text)
{
    std::string result;
    while (!text.empty()) {
        const std::size_t end = text.front() == '&' ? text.find(';') : std::string_view::npos;
        if (end != std::string_view::npos && end < 10) {
            result += decoded(text.substr(1, end - 1));
            text.remove_prefix(end + 1);
        } else {
            result += text.front();
            text.remove_prefix(1);
        }
    }
    return result;
}

/// `name="VALUE"` inside a tag.
std::string_view attribute(std::string_view tag, std::string_view name)
{
    const std::size_t at = tag.find(std::string(name) + "=\"");
    if (at == std::string_view::npos)
        return {};
    tag.remove_prefix(at + name.size() + 2);
    return tag.substr(0, tag.find('"'));
}

/// A tag's meaning: it begins or ends a block, or a look, or it is one of those that say nothing of
/// their own.
class PageReader {
public:
    Document read(std::string_view html)
    {
        while (!html.empty()) {
            const std::size_t end = html.starts_with("<!--") ? html.find("-->")
                                    : html.front() == '<'    ? html.find('>')
                                                             : std::string_view::npos;
            if (end == std::string_view::npos) {
                const std::size_t length = std::max<std::size_t>(html.find('<', 1), 1);
                text_ += withoutEntities(html.substr(0, length));
                html.remove_prefix(std::min(length, html.size()));
                continue;
            }
            const std::string_view tag = html.substr(1, end - 1);
            html.remove_prefix(html.find('>', end) + 1);
            if (!tag.starts_with('!') && !takeTag(tag))
                text_ += "<" + std::string(tag) + ">";
        }
        endBlock();
        return std::move(page_);
    }

private:
    static constexpr std::array<std::string_view, 3> silent{"html", "body", "meta"};

    bool takeTag(std::string_view tag)
    {
        const bool isEnd = tag.starts_with('/');
        const std::string_view whole = isEnd ? tag.substr(1) : tag;
        const std::string_view name = whole.substr(0, whole.find_first_of(" /\n"));
        return takeLook(name, isEnd) || takeLink(name, whole, isEnd) || takeList(name, isEnd) ||
               takeBlock(name, isEnd) ||
               std::find(silent.begin(), silent.end(), name) != silent.end();
    }

    bool takeLook(std::string_view name, bool isEnd)
    {
        if (name != "b" && name != "code")
            return false;
        endSpan();
        look_ = isEnd ? Span::Look::Plain : name == "b" ? Span::Look::Bold : Span::Look::Verbatim;
        return true;
    }

    bool takeLink(std::string_view name, std::string_view tag, bool isEnd)
    {
        if (name != "a")
            return false;
        if (isEnd)
            return true;
        if (const auto mark = attribute(tag, "name"); !mark.empty())
            block_.mark = mark;
        std::string page(attribute(tag, "href"));
        page = page.substr(0, page.find(".html"));
        if (!page.empty() &&
            std::find(page_.links.begin(), page_.links.end(), page) == page_.links.end())
            page_.links.push_back(page);
        return true;
    }

    bool takeList(std::string_view name, bool isEnd)
    {
        if (name != "ul" && name != "ol" && name != "dl" && name != "table")
            return false;
        endBlock();
        number_ = name == "ol" && !isEnd ? std::optional(0) : std::nullopt;
        return true;
    }

    bool takeBlock(std::string_view name, bool isEnd)
    {
        using Kind = Block::Kind;
        if (name == "td") {
            if (!isEnd && isInRow_ && !block_.text.empty())
                isSecondCell_ = true;
            endSpan();
            return true;
        }
        if (name == "head" || name == "title" || name == "h1" || name == "h2" || name == "p" ||
            name == "li" || name == "dt" || name == "dd" || name == "tr" || name == "pre") {
            endBlock();
            if (isEnd)
                return true;
            isInRow_ = name == "tr";
            isTitle_ = name == "h1";
            isLeftOut_ = name == "head" || name == "title";
            block_.kind = name == "h2"    ? Kind::Heading
                          : name == "li"  ? Kind::Item
                          : name == "dt"  ? Kind::Term
                          : name == "dd"  ? Kind::Definition
                          : name == "tr"  ? Kind::Row
                          : name == "pre" ? Kind::Example
                                          : Kind::Paragraph;
            if (block_.kind == Kind::Item)
                block_.mark = number_ ? std::to_string(++*number_) + "." : "•";
            return true;
        }
        return false;
    }

    void endSpan()
    {
        std::string text = std::exchange(text_, {});
        Spans& spans = isSecondCell_ ? block_.explanation : block_.text;
        if (block_.kind != Block::Kind::Example)
            text = joinedLines(text);
        // A blank is enough where two looks meet, and none is wanted where a block begins.
        if (text.starts_with(' ') && (spans.empty() || spans.back().text.ends_with(' ')))
            text.erase(0, 1);
        if (!text.empty())
            spans.push_back({look_, std::move(text)});
    }

    static void trimEnd(Spans& spans)
    {
        if (!spans.empty() && spans.back().text.ends_with(' '))
            spans.back().text.pop_back();
        if (!spans.empty() && spans.back().text.empty())
            spans.pop_back();
    }

    void endBlock()
    {
        // What stands between two blocks belongs to none.
        const bool isBetween =
            block_.text.empty() && text_.find_first_not_of(" \t\r\n") == std::string::npos;
        if (isBetween)
            text_.clear();
        endSpan();
        trimEnd(block_.text);
        trimEnd(block_.explanation);
        if (isTitle_)
            page_.title = wordsOf(block_.text);
        else if (!isLeftOut_ && !block_.text.empty())
            page_.blocks.push_back(std::move(block_));
        block_ = {};
        look_ = Span::Look::Plain;
        isSecondCell_ = isInRow_ = isTitle_ = isLeftOut_ = false;
    }

    Document page_;
    Block block_;
    std::string text_;
    Span::Look look_ = Span::Look::Plain;
    std::optional<int> number_;
    bool isInRow_ = false;
    bool isSecondCell_ = false;
    bool isTitle_ = false;
    bool isLeftOut_ = false;
};

}  // namespace

std::string wordsOf(const Spans& spans)
{
    std::string words;
    for (const Span& span : spans)
        words += span.text;
    return words;
}

Document readHelpPage(std::string_view html)
{
    return PageReader().read(html);
}

}  // namespace orvane::manual
