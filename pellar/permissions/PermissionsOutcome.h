// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/outcome/Outcome.h"
#include "pellar/permissions/Tally.h"
#include "pellar/texts/Texts.h"

#include <string>

namespace pellar {

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
