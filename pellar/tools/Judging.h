// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/tools/Tool.h"

#include <optional>
#include <span>

namespace pellar {

// The judgements that every tool's own is made of; `detail` is the exit status.

Judgement sound(std::int32_t detail);
Judgement damaged(std::int32_t detail, Sentence reason = {});
/// The volume is longer than what is there of it.
Judgement cutShort(std::int32_t detail);
Judgement inconclusive(std::int32_t detail, Sentence reason);
Judgement stopped(std::int32_t detail);
Judgement failed(std::int32_t detail, Sentence reason,
                 contract::ErrorCode code = contract::kPLErrorToolFailed);

/// The disk cannot be read at this byte of the volume, where that is known.
Judgement unreadable(std::optional<std::uint64_t> byte);

/// The tool crashed or gave up: damaged by what it had named before, where that stands, else
/// failed.
Judgement brokenOff(const RunEvidence& evidence, std::int32_t detail, Sentence reason);

/// The tool found something, or we did.
bool hasDamage(const RunEvidence& evidence);

/// What the way in which a run ended says by itself: it was stopped, never began, was ended by us
/// or was killed. None when the tool came to an exit status, which is then to be judged.
std::optional<Judgement> judgementOfEnding(const RunEvidence& evidence, std::string_view tool);

/// What the exit statuses of a tool mean when it verifies.
struct ExitMeanings {
    std::string_view tool;
    std::span<const int> damaged;  ///< damage was found, or the tool gave up
    /// Whether a repair got somewhere, so that another may get further; never when null.
    bool (*madeProgress)(int status, const Findings& findings) = nullptr;
};

/// How the run ended, and where it came to an exit status, what that means.
Judgement judgeRun(const RunEvidence& evidence, const ExitMeanings& meanings);

/// A verification by a tool whose exit status is one number. A volume is sound only with 0, a run
/// that came to its end, and nothing that speaks against it; what could not be checked is
/// inconclusive.
Judgement judgeVerification(int status, const RunEvidence& evidence, const ExitMeanings& meanings);

}  // namespace pellar
