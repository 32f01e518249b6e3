// SPDX-License-Identifier: Apache-2.0
#include "orvane/jobs/ReportEncoding.h"

#include <utility>

namespace orvane {
namespace {

using Kind = ReportLine::Kind;

/// As wide as the text is long, as far as a file of text can tell.
std::string rule(const std::string& text, char sign)
{
    std::string line;
    for (const char c : text)
        if ((static_cast<unsigned char>(c) & 0xC0U) != 0x80U)
            line += sign;
    return text + "\n" + line + "\n";
}

class TextEncoding final : public ReportEncoding {
public:
    std::string begin(std::string_view /*title*/) override { return {}; }
    std::string end() override { return {}; }

    std::string add(const ReportLine& line) override
    {
        const bool isFirstRow =
            line.kind == Kind::Row && std::exchange(previous_, line.kind) != Kind::Row;
        previous_ = line.kind;
        switch (line.kind) {
            case Kind::Title: return rule(line.text, '=');
            case Kind::Disk: return "\n\n" + rule(line.text, '-');
            case Kind::Run: return "\n" + line.text + "\n";
            case Kind::Fact: return line.name + ": " + line.text + "\n";
            case Kind::Part: return "    " + line.text + "\n";
            case Kind::Row: break;
        }
        return (isFirstRow ? "\n    " : "    ") + line.text + "\n";
    }

private:
    Kind previous_ = Kind::Title;
};

std::string escaped(std::string_view text)
{
    std::string result;
    for (const char c : text) {
        switch (c) {
            case '&': result += "&amp;"; break;
            case '<': result += "&lt;"; break;
            case '>': result += "&gt;"; break;
            case '"': result += "&quot;"; break;
            case '\'': result += "&#39;"; break;
            default: result += c;
        }
    }
    return result;
}

constexpr std::string_view style = R"(
:root { color-scheme: light dark; }
body { font-family: sans-serif; max-width: 60em; margin: 2em auto; padding: 0 1em; }
h2 { border-bottom: 1px solid; margin-top: 2em; }
th { text-align: start; vertical-align: top; font-weight: normal; padding-inline-end: 1.5em; opacity: .75; }
td, h3, p, li { overflow-wrap: anywhere; }
ol { list-style: none; padding: 0; font-family: monospace; white-space: pre-wrap; }
.bad { color: light-dark(#b00000, #ff8080); }
.good { color: light-dark(#006a1a, #7fd08f); }
.bold { font-weight: bold; }
)";

/// Facts are the rows of a table, parts and rows those of a list; each is open as long as its kind
/// of line goes on.
class HTMLEncoding final : public ReportEncoding {
public:
    explicit HTMLEncoding(std::string language) : language_(std::move(language)) {}

    std::string begin(std::string_view title) override
    {
        return "<!DOCTYPE html>\n<html lang=\"" + escaped(language_) +
               "\">\n<head><meta charset=\"utf-8\"><title>" + escaped(title) + "</title><style>" +
               std::string(style) + "</style></head>\n<body>\n";
    }

    std::string end() override { return closeOpen("") + "</body>\n</html>\n"; }

    std::string add(const ReportLine& line) override
    {
        const std::string text = escaped(line.text);
        switch (line.kind) {
            case Kind::Title: return closeOpen("") + "<h1>" + text + "</h1>\n";
            case Kind::Disk: return closeOpen("") + "<h2>" + text + "</h2>\n";
            case Kind::Run: return closeOpen("") + element("h3", line);
            case Kind::Fact:
                return closeOpen("table") + "<tr><th scope=\"row\">" + escaped(line.name) +
                       "</th>" + element("td", line, "</tr>\n");
            case Kind::Part:
            case Kind::Row: break;
        }
        return closeOpen("ol") + element("li", line);
    }

private:
    /// Closes what is open and opens `wanted`, unless it is the same.
    std::string closeOpen(std::string_view wanted)
    {
        if (open_ == wanted)
            return {};
        std::string marks = open_.empty() ? "" : "</" + std::string(open_) + ">\n";
        open_ = wanted;
        return marks + (wanted.empty() ? "" : "<" + std::string(wanted) + ">\n");
    }

    static std::string element(const std::string& name, const ReportLine& line,
                               const std::string& behind = "\n")
    {
        std::string looks = line.tone == ReportLine::Tone::Bad    ? "bad"
                            : line.tone == ReportLine::Tone::Good ? "good"
                                                                  : "";
        if (line.isBold)
            looks += looks.empty() ? "bold" : " bold";
        return "<" + name + (looks.empty() ? "" : " class=\"" + looks + "\"") + ">" +
               escaped(line.text) + "</" + name + ">" + behind;
    }

    const std::string language_;
    std::string_view open_;
};

}  // namespace

std::unique_ptr<ReportEncoding> makeTextEncoding()
{
    return std::make_unique<TextEncoding>();
}

std::unique_ptr<ReportEncoding> makeHTMLEncoding(std::string language)
{
    return std::make_unique<HTMLEncoding>(std::move(language));
}

}  // namespace orvane
