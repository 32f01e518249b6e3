// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

namespace pellar {

/// How grave a finding is.
enum class FindingLevel {
    Note,         ///< worth telling, no damage
    Repairable,   ///< what is lost is there a second time
    NeedsPerson,  ///< no program can know what is right
};

enum class FindingKind {
    PrimaryUnreadable,
    PrimaryMissing,
    PrimaryHeaderChecksum,
    PrimaryHeaderNumbers,
    PrimaryEntriesChecksum,
    BackupUnreadable,
    BackupMissing,
    BackupHeaderChecksum,
    BackupHeaderNumbers,
    BackupEntriesChecksum,
    BackupNotAtEnd,
    CopiesDiffer,
    NoValidCopy,
    DiskCut,
    DiskFilled,
    ProtectiveMissing,
    ProtectiveWrongSize,
    ProtectiveWrongStart,
    ProtectiveReplaced,
    Hybrid,
    Remnants,
    EndBeforeStart,
    BeyondDisk,
    OutsideUsable,
    Overlap,
    SameIdentifier,
    StartsAtMap,
    EmptyPartition,
    OutsideExtended,
    BadBootFlag,
    TwoActive,
    SeveralExtended,
    ChainBroken,
    ChainOutside,
    ChainLoop,
    ChainTooLong,
    More,  ///< so many more findings
};

/// Numbers are shown as the user's language writes them.
using FindingArgument = std::variant<std::uint64_t, std::string>;

struct Finding {
    FindingKind kind;
    /// Fill "%1$@" and so on of the text. Texts among them are fit to be shown.
    std::vector<FindingArgument> arguments;
};

FindingLevel levelOf(FindingKind kind);
/// One sentence in English, which is the text key.
std::string_view textOf(FindingKind kind);

}  // namespace pellar
