// SPDX-License-Identifier: Apache-2.0
#include "fixwell/messagelog/LineClassifier.h"

#include "contract/pellar/ResultPhrases.h"

#include <string>
#include <vector>

namespace fixwell {
namespace {

FXWLineClass classFor(LinePhrase meaning)
{
    switch (meaning) {
        case LinePhrase::Success: return FXWLineSuccess;
        case LinePhrase::Failure: return FXWLineFailure;
        case LinePhrase::Repairing: return FXWLineRepairing;
    }
    return FXWLineOther;
}

}  // namespace

FXWLineClass LineClassifier::classOf(std::string_view line)
{
    const std::size_t first = phrases().firstIn(line);
    return first == PhraseMatcher::none ? FXWLineOther : classFor(resultPhrases[first].meaning);
}

const PhraseMatcher& LineClassifier::phrases()
{
    const std::uint64_t revision = bundle_.stringRevision();
    if (!phrases_ || revision != revision_) {
        std::vector<std::string> texts;
        for (const ResultPhrase& phrase : resultPhrases)
            texts.push_back(bundle_.localizedString(phrase.key, {}, resultPhraseTable));
        phrases_.emplace(texts);
        revision_ = revision;
    }
    return *phrases_;
}

bool scanForSpecialChars(std::string_view line)
{
    return line.find(errorMarker) != std::string_view::npos;
}

std::string_view removeSpecialChars(std::string_view line)
{
    const std::size_t marker = line.find(errorMarker);
    std::size_t end = line.find("[0m");
    if (end == std::string_view::npos)
        end = line.find("[30m");
    if (marker == std::string_view::npos || end == std::string_view::npos)
        return line;
    const std::size_t start = marker + errorMarker.size();
    return end < start ? line : line.substr(start, end - start);
}

}  // namespace fixwell
