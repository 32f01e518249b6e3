// SPDX-License-Identifier: Apache-2.0
// How bash(1) and readline(3) write words, and what they are given to put into a line.

#include "contract/foundation/UTF8.h"
#include "orvane/terminal/Completion.h"

#include <fmt/format.h>

#include <algorithm>
#include <filesystem>
#include <system_error>
#include <utility>

namespace orvane {
namespace {

namespace fs = std::filesystem;
using Quote = ShellLine::Quote;

constexpr std::string_view lettersAndDigits =
    "abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ0123456789";

class LineReader {
public:
    ShellLine read(std::string_view line)
    {
        begin();
        while (!line.empty()) {
            const char character = line.front();
            line.remove_prefix(1);
            if (isEscaped_)
                takeEscaped(character);
            else if (line_.quote == Quote::None)
                takePlain(character, line);
            else
                takeQuoted(character);
        }
        return std::move(line_);
    }

private:
    void begin()
    {
        line_.words.emplace_back();
        line_.rest.clear();
        line_.isExpanded = isInWord_ = false;
    }

    void takeEscaped(char character)
    {
        isEscaped_ = false;
        line_.rest += character;
        // Between double quotes it escapes these alone (bash(1), QUOTING).
        if (line_.quote == Quote::Double &&
            std::string_view("$`\"\\").find(character) == std::string_view::npos)
            line_.words.back() += '\\';
        line_.words.back() += character;
    }

    void takePlain(char character, std::string_view& line)
    {
        if (character == ' ' || character == '\t' || character == '\n') {
            if (isInWord_)
                begin();
            return;
        }
        const bool isFirst = !std::exchange(isInWord_, true);
        line_.rest += character;
        if (character == '\\') {
            isEscaped_ = true;
        } else if (character == '\'') {
            line_.quote = Quote::Single;
        } else if (character == '"') {
            line_.quote = Quote::Double;
        } else if (character == '$' && line.starts_with('\'')) {
            line_.rest += '\'';
            line.remove_prefix(1);
            line_.quote = Quote::Dollar;
        } else {
            line_.isExpanded = line_.isExpanded || (isFirst && character == '~') ||
                               std::string_view("$`*?[{").find(character) != std::string_view::npos;
            line_.words.back() += character;
        }
    }

    void takeQuoted(char character)
    {
        line_.rest += character;
        const char end = line_.quote == Quote::Double ? '"' : '\'';
        if (character == end) {
            line_.quote = Quote::None;
        } else if (character == '\\' && line_.quote != Quote::Single) {
            isEscaped_ = true;
            // What $'…' makes of an escape is not followed: few write it by hand.
            line_.isExpanded = line_.isExpanded || line_.quote == Quote::Dollar;
        } else {
            line_.isExpanded = line_.isExpanded || (line_.quote == Quote::Double &&
                                                    (character == '$' || character == '`'));
            line_.words.back() += character;
        }
    }

    ShellLine line_;
    bool isEscaped_ = false;
    bool isInWord_ = false;
};

bool isShown(std::string_view text)
{
    return contract::printable(text) == text && text.find('\t') == std::string_view::npos;
}

/// Inside $'…', in printable ASCII and well-formed UTF-8 alone.
std::string dollarText(std::string_view text)
{
    std::string result;
    while (!text.empty()) {
        std::string_view rest = text;
        contract::takeCharacter(rest);
        const std::string_view character = text.substr(0, text.size() - rest.size());
        if (character == "'" || character == "\\")
            result += "\\" + std::string(character);
        else if (isShown(character))
            result += character;
        else  // three digits, that none that follows is taken for a part of it
            for (const char byte : character)
                result += fmt::format("\\{:03o}", static_cast<unsigned char>(byte));
        text = rest;
    }
    return result;
}

/// Readline closes the quotes of a word, but not where its last letter looks as if they were
/// closed; and puts a text that begins with the quote in the place of the one that is there.
std::string readlineText(std::string text, Quote quote)
{
    if (quote == Quote::None)
        return text;
    const char mark = quote == Quote::Double ? '"' : '\'';
    return (text.starts_with(mark) ? std::string(1, mark) : "") + text + mark;
}

/// Files and directories that the word may be the beginning of. None where they cannot be read.
std::vector<Candidate> filesFor(const std::string& word)
{
    const std::string directory = word.substr(0, word.rfind('/') + 1);
    const std::string begin = word.substr(directory.size());
    std::vector<Candidate> files;
    std::error_code error;
    for (fs::directory_iterator entry(directory.empty() ? "." : directory, error), end;
         !error && entry != end; entry.increment(error)) {
        const std::string name = entry->path().filename();
        std::error_code ignored;
        const fs::file_status status = entry->status(ignored);
        const bool isDirectory = fs::is_directory(status);
        const bool isMeant =
            name.starts_with(begin) && (begin.starts_with('.') || !name.starts_with('.'));
        if (!isMeant ||
            (!isDirectory && !fs::is_regular_file(status) && !fs::is_block_file(status)))
            continue;
        // As it stands it would be an option, or a label.
        const bool isMistakable =
            word.empty() && (name.starts_with('-') || name.find('=') != std::string::npos);
        files.push_back({(isMistakable ? "./" : directory) + name + (isDirectory ? "/" : "")});
    }
    return files;
}

}  // namespace

ShellLine readShellLine(std::string_view line)
{
    return LineReader().read(line);
}

std::string bashText(std::string_view text, Quote quote)
{
    if (quote == Quote::Dollar)
        return dollarText(text);
    if (quote == Quote::None && !isShown(text))
        return "$'" + dollarText(text) + "'";
    std::string result;
    while (!text.empty()) {
        std::string_view rest = text;
        contract::takeCharacter(rest);
        const std::string character(text.substr(0, text.size() - rest.size()));
        const bool isLetter =
            character.size() > 1 || lettersAndDigits.find(character) != std::string_view::npos;
        const char end = quote == Quote::Single ? '\'' : '"';
        if (quote != Quote::None && !isShown(character))
            result += end + ("$'" + dollarText(character) + "'") + end;
        else if (quote == Quote::Single)
            result += character == "'" ? "'\\''" : character;
        // A history's event is looked for between double quotes as well.
        else if (quote == Quote::Double && character == "!")
            result += "\"'!'\"";
        else if (quote == Quote::Double)
            result +=
                (std::string_view("$`\"\\").find(character) != std::string_view::npos ? "\\" : "") +
                character;
        else
            result += (isLetter || std::string_view("/._-+:=,@%").find(character) !=
                                       std::string_view::npos
                           ? ""
                           : "\\") +
                      character;
        text = rest;
    }
    return result;
}

std::string bashReply(std::string_view line, std::string_view replaced,
                      const CompletionSources& sources)
{
    const ShellLine read = readShellLine(line);
    const std::string& word = read.words.back();
    if (read.words.size() < 2)
        return "\n";
    Offer offer = offerFor({read.words.begin() + 1, read.words.end()}, sources);
    const auto flags = [&](bool isWhole) {
        return std::string(offer.takesFiles ? "files" : "") + (isWhole ? "" : " nospace") + "\n";
    };
    // What stays in the line, and what stays of the word with it.
    if (read.isExpanded || !read.rest.ends_with(replaced))
        return flags(true);
    const std::string kept = read.rest.substr(0, read.rest.size() - replaced.size());
    const ShellLine before = readShellLine(kept);
    const std::string& keptWord = before.words.back();
    // Inside quotes readline's own completion of names knows when not to close them.
    if (offer.takesFiles && before.quote == Quote::None)
        for (Candidate& file : filesFor(word))
            offer.candidates.push_back(std::move(file));
    std::vector<std::string> texts;
    bool isWhole = true;
    for (const Candidate& candidate : offer.candidates) {
        if (!candidate.value.starts_with(word) || !candidate.value.starts_with(keptWord))
            continue;
        texts.push_back(readlineText(
            bashText(std::string_view(candidate.value).substr(keptWord.size()), before.quote),
            before.quote));
        isWhole = isWhole && !candidate.value.ends_with('/');
    }
    std::sort(texts.begin(), texts.end());
    texts.erase(std::unique(texts.begin(), texts.end()), texts.end());
    std::string reply = flags(isWhole);
    for (const std::string& text : texts)
        reply += text + "\n";
    return reply;
}

}  // namespace orvane
