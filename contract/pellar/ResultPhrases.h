// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <string_view>

namespace contract {

/// What a plain text line of a checking tool says, by the phrase that occurs in it.
enum class LinePhrase { Success, Failure, Repairing };

struct ResultPhrase {
    std::string_view key;  ///< in the string table "LocalizableFsck"
    LinePhrase meaning;
};

/// The phrases by which the library states a result in a plain line, in the order in which the
/// module tests them: the first that occurs decides. The library says its verdicts in them and
/// sees to it that nothing else it passes on holds one.
inline constexpr std::array<ResultPhrase, 11> resultPhrases{{
    {"appears to be OK.", LinePhrase::Success},
    {"was repaired successfully.", LinePhrase::Success},
    {"needs to be repaired.", LinePhrase::Failure},
    {"could not be repaired.", LinePhrase::Failure},
    {"Volume check failed.", LinePhrase::Failure},
    {"Cannot repair volume when it is mounted with write access.", LinePhrase::Failure},
    {"could not be repaired after 3 attempts.", LinePhrase::Failure},
    {"Repairing volume.", LinePhrase::Repairing},
    {"Rebuilding Catalog B-tree.", LinePhrase::Repairing},
    {"Rebuilding Extents Overflow B-tree.", LinePhrase::Repairing},
    {"Rebuilding Extended Attributes B-tree.", LinePhrase::Repairing},
}};

inline constexpr std::string_view resultPhraseTable = "LocalizableFsck";

/// The marker that makes the module take a plain line for an error of the tool.
inline constexpr std::string_view errorMarker = "[31m";

}  // namespace contract
