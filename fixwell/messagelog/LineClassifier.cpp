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

}  // namespace fixwell
