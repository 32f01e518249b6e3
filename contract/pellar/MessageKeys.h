// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Name.h"

#include <cstdint>

namespace contract {

// The keys of a message dictionary; the log's records carry the same.

inline const Name kFsckMessageType{"fsck_msg_type"};
/// May hold the placeholders "%1$@", "%2$@", ... that the parameters fill.
inline const Name kFsckMessageString{"fsck_msg_string"};
inline const Name kFsckVerbosity{"fsck_verbosity"};
inline const Name kFsckParameters{"parameters"};

// The message types.

inline const Name kFsckVerify{"VERIFY"};    ///< a step of a verification
inline const Name kFsckRepair{"REPAIR"};    ///< a step of a repair
inline const Name kFsckError{"ERROR"};      ///< a problem that was found
inline const Name kFsckSuccess{"SUCCESS"};  ///< a good result
inline const Name kFsckFail{"FAIL"};        ///< a failed operation, or a warning
/// A line of a tool that tells of a problem. Drawn as plain text: what it comes to is told as an
/// ERROR.
inline const Name kFsckProblem{"PROBLEM"};
inline const Name kFsckProgress{"PROGRESS"};  ///< the first parameter is the percentage done

/// How much a record matters. A missing number reads as `main`.
namespace verbosity {
inline constexpr std::int64_t summary = -2;  ///< closes a run; hidden while it is the last record
inline constexpr std::int64_t heading = -1;  ///< drawn bold
inline constexpr std::int64_t main = 0;
inline constexpr std::int64_t detail = 1;  ///< from here on shown only with details
inline constexpr std::int64_t fine = 2;
}  // namespace verbosity

// The keys of a result dictionary, which a finished job hands over beside its error code.

/// One of the verdicts below.
inline const Name kPLVerdict{"kPLVerdict"};
/// One sentence that names the attempt, the disk and the outcome.
inline const Name kPLMessage{"kPLMessage"};

/// The tool that did the work, with its version where it says it: "e2fsck 1.47.0". Absent where
/// none ran.
inline const Name kPLTool{"kPLTool"};
/// How many problems were told of, and of how many kinds they are; absent where none was, the
/// second also where only the least is known.
inline const Name kPLProblems{"kPLProblems"};
inline const Name kPLProblemKinds{"kPLProblemKinds"};

/// The result holds, but something was lost or moved for it; the message says what. Absent
/// otherwise.
inline const Name kPLHasLosses{"kPLHasLosses"};

inline const Name kPLVerdictSound{"sound"};
inline const Name kPLVerdictDamaged{"damaged"};            ///< damage is left
inline const Name kPLVerdictRepaired{"repaired"};          ///< damage was found, none is left
inline const Name kPLVerdictInconclusive{"inconclusive"};  ///< it could not be known
inline const Name kPLVerdictFailed{"failed"};              ///< the check did not run to an answer
inline const Name kPLVerdictStopped{"stopped"};            ///< by the user
inline const Name kPLVerdictUndone{"undone"};              ///< a repair was taken back

}  // namespace contract
