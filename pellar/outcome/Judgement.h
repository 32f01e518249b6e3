// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/pellar/ErrorCodes.h"
#include "pellar/texts/Sentence.h"

#include <cstdint>

namespace pellar {

enum class Verdict { Sound, Damaged, Repaired, Inconclusive, Failed, Stopped };

/// What one run of a tool showed.
struct Judgement {
    Verdict verdict = Verdict::Failed;
    /// 0 for Sound; for the others what the job reports when this run decides it.
    contract::ErrorCode code = contract::kPLNoError;
    /// The tool's own number: exit status, signal or errno.
    std::int32_t detail = 0;
    /// Why, where the verdict does not say all.
    Sentence reason;
    /// A repair changed something, so running it again may get further.
    bool madeProgress = false;

    friend bool operator==(const Judgement&, const Judgement&) = default;
};

}  // namespace pellar
