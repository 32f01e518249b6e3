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
    std::vector<Sentence> sentences{sentenceAbout(
        tally.compared, "%1$@ file was compared with what its package says. Different: %2$@.",
        "%1$@ files were compared with what their packages say. Different: %2$@.",
        std::to_string(tally.differing))};
    const auto add = [&sentences](std::uint64_t count, std::string_view one,
                                  std::string_view many) {
        if (count > 0)
            sentences.push_back(sentenceAbout(count, one, many));
    };
    add(tally.withoutSource,
        "%1$@ file was not compared: it is not known here what permissions its package gives it.",
        "%1$@ files were not compared: it is not known here what permissions their packages give "
        "them.");
    add(tally.packagesBeyondBounds,
        "%1$@ package was not compared: it is larger than any package may be.",
        "%1$@ packages were not compared: they are larger than any package may be.");
    add(tally.foreign,
        "%1$@ file may not lend the rights of others: its content is not known to be its "
        "package's.",
        "%1$@ files may not lend the rights of others: their content is not known to be their "
        "packages'.");
    add(tally.undecided,
        "%1$@ file is undecided: the system may rightly have changed it after its installation.",
        "%1$@ files are undecided: the system may rightly have changed them after their "
        "installation.");
    add(tally.unreachable, "%1$@ file could not be reached.", "%1$@ files could not be reached.");
    add(tally.elsewhere, "%1$@ file is on another volume.", "%1$@ files are on another volume.");
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
