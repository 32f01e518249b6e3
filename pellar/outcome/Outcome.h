// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Name.h"
#include "pellar/outcome/FileChange.h"
#include "pellar/outcome/Judgement.h"
#include "pellar/outcome/Task.h"
#include "pellar/texts/Texts.h"

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace pellar {

/// How a job ended.
struct Outcome {
    Verdict verdict = Verdict::Failed;
    contract::ErrorCode code = contract::kPLErrorToolFailed;
    std::int32_t detail = 0;
    Sentence reason;
    /// What a repair cost, to be seen by everybody; `reason` then says the gravest of it.
    std::vector<Sentence> warnings = {};

    friend bool operator==(const Outcome&, const Outcome&) = default;
};

/// One repairing run of a tool.
struct RepairPass {
    Judgement judgement;
    bool replayedJournal = false;
    bool foundProblems = false;
};

/// What became of the files in a repair, as far as it is known.
struct FileCounts {
    std::optional<std::uint64_t> before;
    std::optional<std::uint64_t> after;
    std::uint64_t reconnected = 0;
    std::uint64_t cleared = 0;
    std::string_view collectedOne = {};  ///< ToolHabits
    std::string_view collectedMany = {};
    std::vector<FileChange> changes = {};  ///< that the tool told of
};

/// The losses that a repaired volume is left with, the gravest first; none when nothing is known to
/// be lost.
std::vector<Sentence> lossesOf(const FileCounts& counts);

inline constexpr std::size_t mostRepairPasses = 5;

Outcome failedOutcome(contract::ErrorCode code, Sentence reason);
Outcome outcomeOfVerification(const Judgement& judgement);
/// The same for a kind of volume that is not repaired here: no repair is advised.
Outcome outcomeWithoutRepair(const Judgement& judgement);

/// Whether to repair once more: damage is left, and the last pass got somewhere.
bool isWorthAnotherPass(const std::vector<RepairPass>& passes, const Judgement& confirmation);

/// The verification after the passes decides, whatever they said themselves.
Outcome outcomeOfRepair(const std::vector<RepairPass>& passes, const Judgement& confirmation,
                        const FileCounts& counts = {});

contract::Name nameOf(Verdict verdict);

/// A message as a line of its own: with a capital at the beginning.
std::string asLine(std::string message);

/// One sentence that names the attempt, the disk and the outcome.
std::string messageOf(const Outcome& outcome, Operation operation, const std::string& diskName,
                      const Texts& texts);

}  // namespace pellar
