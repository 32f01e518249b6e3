// SPDX-License-Identifier: Apache-2.0
#include "pellar/jobs/LineGuard.h"

#include <string>
#include <vector>

namespace pellar {
namespace {

std::vector<std::string> localizedPhrases(const Texts& texts)
{
    std::vector<std::string> phrases;
    for (const contract::ResultPhrase& phrase : contract::resultPhrases)
        phrases.push_back(texts.resultText(phrase.key));
    return phrases;
}

std::vector<std::string> suspiciousPhrases(const Texts& texts)
{
    std::vector<std::string> phrases = localizedPhrases(texts);
    for (const contract::ResultPhrase& phrase : contract::resultPhrases)
        phrases.emplace_back(phrase.key);
    phrases.emplace_back(contract::errorMarker);
    return phrases;
}

}  // namespace

LineGuard::LineGuard(const Texts& texts)
    : localized_(localizedPhrases(texts)), everything_(suspiciousPhrases(texts))
{
}

bool LineGuard::isSuspicious(std::string_view line) const
{
    return everything_.firstIn(line) != contract::PhraseMatcher::none;
}

std::optional<contract::LinePhrase> LineGuard::meaningOf(std::string_view line) const
{
    const std::size_t first = localized_.firstIn(line);
    if (first == contract::PhraseMatcher::none)
        return std::nullopt;
    return contract::resultPhrases[first].meaning;
}

}  // namespace pellar
