// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/outcome/Judgement.h"
#include "pellar/outcome/Outcome.h"
#include "pellar/permissions/Inspection.h"
#include "pellar/texts/Sentence.h"
#include "pellar/texts/Texts.h"

#include <cstdint>
#include <string>
#include <vector>

namespace pellar {

/// What became of all installed files in one look at them.
struct Tally {
    std::uint64_t compared = 0;
    std::uint64_t differing = 0;  ///< of those
    std::uint64_t undecided = 0;
    std::uint64_t foreign = 0;  ///< of the differing: of other contents than the package's
    std::uint64_t withoutSource = 0;
    std::uint64_t packagesBeyondBounds = 0;  ///< larger than a package may be
    std::uint64_t missing = 0;
    std::uint64_t elsewhere = 0;    ///< on another file system, which is another volume's
    std::uint64_t unreachable = 0;  ///< behind a link, or not readable

    void count(Unseen unseen);
};

/// A sentence for each number that is worth telling. None passes in silence what nobody compared.
std::vector<Sentence> sentencesOf(const Tally& tally);

/// Sound only when there was something to compare every file with. Undecided files do not make
/// it less: that much is told.
Verdict verdictOf(const Tally& tally);

/// Files that differ are a finding and not a failure of the job: its error is 0, its verdict says
/// damaged. It fails when nothing could be compared.
Outcome outcomeOfPermissionsVerification(const Tally& tally);

/// After the look that followed the repair, whatever was thought to be set right before.
Outcome outcomeOfPermissionsRepair(const Tally& afterwards, std::uint64_t restored);

/// An empty reason: it was stopped.
Outcome outcomeWithoutReferences(const Sentence& reason);

/// One sentence that names the attempt, the disk and the outcome.
std::string permissionsMessageOf(const Outcome& outcome, Operation operation,
                                 const std::string& diskName, const Texts& texts);

}  // namespace pellar
