// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/outcome/Outcome.h"
#include "pellar/partitions/MapReport.h"

namespace pellar {

/// What a verification of the map comes to.
[[nodiscard]] Outcome outcomeOfMapVerification(const PartitionMap& map, const MapReport& report);

/// What a repair comes to, by the verification behind it.
[[nodiscard]] Outcome outcomeOfMapRepair(const PartitionMap& map, const MapReport& confirmation);

/// A repair that was refused, or did not get to its end: the damage is left.
[[nodiscard]] Outcome outcomeOfRefusedRepair(Sentence reason);

/// One sentence that names the attempt, the disk and the outcome.
[[nodiscard]] Sentence mapMessageOf(const Outcome& outcome, Operation operation,
                                    const std::string& diskName, const Texts& texts);

/// The line that states the result; empty for a verdict that is none.
[[nodiscard]] Sentence mapVerdictLine(Verdict verdict, Operation operation,
                                      const std::string& diskName);

}  // namespace pellar
