// SPDX-License-Identifier: Apache-2.0
#include "pellar/packages/TemporaryFileRules.h"

#include "pellar/packages/RootDirectory.h"
#include "pellar/packages/TextLines.h"

#include <fnmatch.h>

#include <algorithm>

namespace pellar {
namespace {

constexpr std::size_t largestFile = 1U << 20U;
/// Each file of the system is held against each pattern. Debian's own rules have some thirty.
constexpr std::size_t mostPatterns = 1000;

bool matches(const std::string& pattern, const std::string& path)
{
    return ::fnmatch(pattern.c_str(), path.c_str(), FNM_PATHNAME) == 0;
}

std::string_view withoutQuotes(std::string_view word)
{
    if (word.size() >= 2 && (word.front() == '"' || word.front() == '\'') &&
        word.front() == word.back())
        return word.substr(1, word.size() - 2);
    return word;
}

bool isSaid(std::string_view field)
{
    return !field.empty() && field != "-";
}

bool isBelowPattern(const std::string& path, const std::string& pattern)
{
    for (std::size_t slash = path.find('/'); slash != std::string::npos;
         slash = path.find('/', slash + 1))
        if (matches(pattern, path.substr(0, slash)))
            return true;
    return false;
}

}  // namespace

// d    /run/screen    1777 root utmp 10d -
void TemporaryFileRules::add(std::string_view text, const PathAliases& aliases)
{
    constexpr std::string_view settingTypes = "fFwdDevqQpbcCzZ";
    forEachLine(text, [&](std::string_view line) {
        const std::string_view type = takeWord(line);
        if (type.empty() || settingTypes.find(type.front()) == std::string_view::npos)
            return;
        const std::string_view path = withoutQuotes(takeWord(line));
        const std::string_view mode = takeWord(line);
        const std::string_view user = takeWord(line);
        if (!path.starts_with('/') || (!isSaid(mode) && !isSaid(user) && !isSaid(takeWord(line))))
            return;
        const std::string place = aliases.canonical(path);
        if (place.find_first_of("*?[") == std::string::npos)
            paths_.insert(place);
        else
            patterns_.push_back(place);
        if (type.front() == 'Z')
            trees_.push_back(place);
    });
}

bool TemporaryFileRules::concern(const std::string& path) const
{
    return patterns_.size() + trees_.size() > mostPatterns || paths_.count(path) > 0 ||
           std::any_of(patterns_.begin(), patterns_.end(),
                       [&](const std::string& pattern) { return matches(pattern, path); }) ||
           std::any_of(trees_.begin(), trees_.end(),
                       [&](const std::string& tree) { return isBelowPattern(path, tree); });
}

TemporaryFileRules temporaryFileRulesOf(const RootFiles& root)
{
    TemporaryFileRules rules;
    for (const std::string directory :
         {"usr/lib/tmpfiles.d", "usr/local/lib/tmpfiles.d", "etc/tmpfiles.d", "run/tmpfiles.d"})
        for (const std::string& name : root.names(directory))
            if (name.ends_with(".conf"))
                rules.add(root.read(directory + '/' + name, largestFile).value_or(""),
                          root.aliases());
    return rules;
}

}  // namespace pellar
