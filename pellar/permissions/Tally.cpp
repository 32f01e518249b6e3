// SPDX-License-Identifier: Apache-2.0
#include "pellar/permissions/Tally.h"

namespace pellar {

void Tally::count(Unseen unseen)
{
    switch (unseen) {
        case Unseen::Missing: ++missing; break;
        case Unseen::ElsewhereMounted: ++elsewhere; break;
        case Unseen::BehindLink:
        case Unseen::Unreadable: ++unreachable; break;
    }
}

std::vector<Sentence> sentencesOf(const Tally& tally)
{
    std::vector<Sentence> sentences{
        {"%1$@ files were compared with what their packages say; %2$@ "
         "differ.",
         std::to_string(tally.compared), std::to_string(tally.differing)}};
    const auto add = [&sentences](std::uint64_t count, std::string_view key) {
        if (count > 0)
            sentences.push_back({key, std::to_string(count), {}});
    };
    add(tally.withoutSource,
        "%1$@ files were not compared: it is not known here what permissions their packages give "
        "them.");
    add(tally.undecided,
        "%1$@ files are undecided: the system may rightly have changed them after their "
        "installation.");
    add(tally.unreachable, "%1$@ files could not be reached.");
    add(tally.elsewhere, "%1$@ files are on another volume.");
    return sentences;
}

Verdict verdictOf(const Tally& tally)
{
    if (tally.differing > 0)
        return Verdict::Damaged;
    const bool isComplete =
        tally.compared > 0 && tally.withoutSource == 0 && tally.unreachable == 0;
    return isComplete ? Verdict::Sound : Verdict::Inconclusive;
}

}  // namespace pellar
