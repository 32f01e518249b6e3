// SPDX-License-Identifier: Apache-2.0
#include "pellar/packages/ScriptMentions.h"

#include "pellar/packages/TextLines.h"

#include <algorithm>
#include <array>
#include <vector>

namespace pellar {
namespace {

/// Commands that change what is there, and others that give what they make permissions of its own.
constexpr std::array<std::string_view, 6> changingCommands{
    "chmod", "chown", "chgrp", "setcap", "setfacl", "dpkg-statoverride"};
constexpr std::array<std::string_view, 4> makingCommands{"install", "mkdir", "adduser", "useradd"};

bool isNameCharacter(char c)
{
    return (c >= '0' && c <= '9') || (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') ||
           static_cast<unsigned char>(c) >= 0x80 ||
           std::string_view("._+-@:~%/").find(c) != std::string_view::npos;
}

struct Token {
    std::string_view text;
    bool followsVariable;  ///< "$directory/x", "${directory}/x"
    bool isOpen;           ///< "/usr/bin/$x", "/etc/x/*": it goes on with what is not known
};

/// Names and paths; everything else only separates them.
std::vector<Token> tokensIn(std::string_view line)
{
    std::vector<Token> tokens;
    std::size_t place = 0;
    while (place < line.size()) {
        const bool isVariable = line[place] == '$' || line[place] == '}';
        if (!isNameCharacter(line[place]) && !isVariable) {
            ++place;
            continue;
        }
        const std::size_t start = place + (isVariable ? 1 : 0);
        place = start;
        while (place < line.size() && isNameCharacter(line[place]))
            ++place;
        const bool isOpen =
            place < line.size() && std::string_view("$*?[{").find(line[place]) != std::string::npos;
        if (place > start)
            tokens.push_back({line.substr(start, place - start), isVariable, isOpen});
        else if (!isVariable)
            ++place;
    }
    return tokens;
}

template <class Commands>
bool hasOneOf(const Commands& commands, const std::vector<Token>& line)
{
    return std::any_of(line.begin(), line.end(), [&](const Token& token) {
        const std::string_view name = token.text.substr(token.text.rfind('/') + 1);
        return std::find(commands.begin(), commands.end(), name) != commands.end();
    });
}

bool setsPermissions(const std::vector<Token>& line)
{
    return hasOneOf(changingCommands, line) || hasOneOf(makingCommands, line);
}

bool reachesTrees(const std::vector<Token>& tokens)
{
    return std::any_of(tokens.begin(), tokens.end(), [](const Token& token) {
        const bool isFlag = token.text.starts_with('-') && !token.text.starts_with("--");
        return token.text == "find" || token.text == "--recursive" ||
               (isFlag && token.text.find('R') != std::string_view::npos);
    });
}

/// A line with those that continue it.
std::vector<std::string> logicalLines(std::string_view script)
{
    std::vector<std::string> lines(1);
    forEachLine(script, [&lines](std::string_view line) {
        const bool continues = line.ends_with('\\');
        lines.back() += line.substr(0, line.size() - (continues ? 1 : 0));
        if (!continues)
            lines.emplace_back();
    });
    return lines;
}

std::size_t depthOf(std::string_view path)
{
    return static_cast<std::size_t>(std::count(path.begin(), path.end(), '/')) + 1;
}

/// Asks about what stands behind each "/" of a path, and so takes the time that one path does,
/// however many there are to be found among.
bool hasEnding(const std::unordered_set<std::string>& endings, const std::string& path)
{
    for (std::size_t slash = path.find('/'); slash != std::string::npos && !endings.empty();
         slash = path.find('/', slash + 1))
        if (endings.count(path.substr(slash + 1)) > 0)
            return true;
    return false;
}

bool isBelowOne(const std::unordered_set<std::string>& trees, const std::string& path)
{
    for (std::size_t slash = path.find('/'); slash != std::string::npos && !trees.empty();
         slash = path.find('/', slash + 1))
        if (trees.count(path.substr(0, slash)) > 0)
            return true;
    return false;
}

}  // namespace

void ScriptMentions::add(std::string_view script, const PathAliases& aliases)
{
    std::vector<std::vector<Token>> lines;
    const std::vector<std::string> texts = logicalLines(script);
    for (const std::string& text : texts)
        lines.push_back(tokensIn(text));
    const bool sets = std::any_of(lines.begin(), lines.end(), setsPermissions);
    if (!sets)
        return;
    const bool isDeep = std::any_of(lines.begin(), lines.end(), reachesTrees);
    for (const std::vector<Token>& line : lines) {
        const bool isCommand = hasOneOf(changingCommands, line);
        for (const Token& token : line) {
            if (token.text.find('/') == std::string_view::npos)
                words_.emplace(token.text);
            else if (token.isOpen && !token.followsVariable)
                addTree(aliases.canonical(token.text.substr(0, token.text.rfind('/'))));
            else
                addPath(token.text, !token.followsVariable, isCommand, aliases);
        }
    }
    if (isDeep)
        std::for_each(paths_.begin(), paths_.end(),
                      [this](const std::string& path) { addTree(path); });
}

// Nobody means all of usr/bin.
void ScriptMentions::addTree(const std::string& path)
{
    if (depthOf(path) > 2)
        trees_.insert(path);
}

// "VARIABLE=/path" and "root:/path" come here whole: the path begins at the first "/".
void ScriptMentions::addPath(std::string_view token, bool isWhole, bool isOnPermissionLine,
                             const PathAliases& aliases)
{
    token.remove_prefix(isWhole ? 0 : token.find('/'));
    const std::string path = aliases.canonical(token);
    if (path.empty())
        return;
    paths_.insert(path);
    if (isOnPermissionLine)
        commandPaths_.insert(path);
    const std::size_t slash = path.rfind('/');
    words_.insert(slash == std::string::npos ? path : path.substr(slash + 1));
    if (!isWhole)
        endings_.insert(path);
}

// The directories that everybody has are spoken of everywhere; only a command's own word counts.
bool ScriptMentions::mayConcernOwn(const std::string& path, FileKind kind) const
{
    const bool isCommonDirectory = kind == FileKind::Directory && depthOf(path) <= 2;
    if (isCommonDirectory)
        return commandPaths_.count(path) > 0;
    const std::size_t slash = path.rfind('/');
    const std::string name = slash == std::string::npos ? path : path.substr(slash + 1);
    return paths_.count(path) > 0 || (kind != FileKind::Directory && words_.count(name) > 0) ||
           hasEnding(endings_, path) || isBelowOne(trees_, path);
}

bool ScriptMentions::mayConcernForeign(const std::string& path) const
{
    return commandPaths_.count(path) > 0 || (depthOf(path) > 2 && paths_.count(path) > 0);
}

void ScriptMentions::addForeign(const ScriptMentions& other)
{
    paths_.insert(other.paths_.begin(), other.paths_.end());
    commandPaths_.insert(other.commandPaths_.begin(), other.commandPaths_.end());
}

}  // namespace pellar
