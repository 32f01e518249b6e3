// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Array.h"
#include "contract/foundation/Dictionary.h"
#include "contract/foundation/StyledText.h"
#include "contract/pellar/MessageKeys.h"
#include "fixwell/Contract.h"

#include <cstdint>
#include <functional>
#include <string>
#include <string_view>

namespace fixwell {

// A message record is a row of the log: a dictionary with the library's message keys and these.

/// Where the record came from; one of the three values below.
inline const Name kOV_typeOfOutputKey{"kOV_typeOfOutputKey"};
inline const Name kOV_typeOfOutput_string{"kOV_typeOfOutput_string"};
inline const Name kOV_typeOfOutput_dict{"kOV_typeOfOutput_dict"};
inline const Name kOV_typeOfOutput_OV_addition{"kOV_typeOfOutput_OV_addition"};
/// The finished text with its font and colour: what is drawn, copied and printed.
inline const Name kOV_finalAttributedString_type{"kOV_finalAttributedString_type"};

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

inline constexpr double messageFontPoints = 11;

inline constexpr Color standardErrorColor{1.0, 0.0, 0.0, 1.0};
inline constexpr Color standardPassColor{0.0, 0.8, 0.2, 1.0};

/// How a record looks: bold for headings, red for problems and failures, green for good results.
TextStyle messageStyle(const Dictionary& record, const Color& errorColor, const Color& passColor);

/// Fills "%1$@", "%2$@", ... of a library message: a string as it is, a dictionary by its first
/// value, a number through `decimal`, anything else by nothing. Every occurrence is replaced,
/// parameter after parameter; what no parameter fills stays.
std::string substitutedParameters(std::string_view text, const Array& parameters,
                                  const std::function<std::string(const Value&)>& decimal);

}  // namespace fixwell
