// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Dictionary.h"
#include "contract/foundation/StyledText.h"
#include "contract/pellar/MessageKeys.h"
#include "fixwell/Contract.h"

#include <cstdint>

namespace fixwell {

// A message record is a row of the log: a dictionary with the library's message keys and these.

/// Where the record came from; one of the three values below.
inline const Name kOV_typeOfOutputKey{"kOV_typeOfOutputKey"};
inline const Name kOV_typeOfOutput_string{"kOV_typeOfOutput_string"};
inline const Name kOV_typeOfOutput_dict{"kOV_typeOfOutput_dict"};
inline const Name kOV_typeOfOutput_OV_addition{"kOV_typeOfOutput_OV_addition"};
/// The finished text with its font and colour: what is drawn, copied and printed.
inline const Name kOV_finalAttributedString_type{"kOV_finalAttributedString_type"};

/// How much a record matters. A missing number reads as `main`.
namespace verbosity {
inline constexpr std::int64_t summary = -2;  ///< closes a run; hidden while it is the last record
inline constexpr std::int64_t heading = -1;  ///< drawn bold
inline constexpr std::int64_t main = 0;
inline constexpr std::int64_t detail = 1;  ///< from here on shown only with details
inline constexpr std::int64_t fine = 2;
}  // namespace verbosity

inline std::int64_t verbosityOf(const Dictionary& record)
{
    return record.integer(kFsckVerbosity);
}

inline bool isShownInBrief(const Dictionary& record)
{
    return verbosityOf(record) < verbosity::detail;
}

inline StyledText finalText(const Dictionary& record)
{
    return record[kOV_finalAttributedString_type].styledText();
}

}  // namespace fixwell
