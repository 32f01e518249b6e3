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

/// Where a partition lies.
struct Extent {
    std::uint64_t first = 0;
    std::uint64_t last = 0;  ///< not before `first`
    std::string label;       ///< what the partition is called in findings
};

/// "3", or "3 “Data”", fit to be shown and to be put into a text.
[[nodiscard]] std::string partitionLabel(std::uint64_t number, const std::string& name);

/// Adds a finding for every partition that another one reaches into, not for every pair.
void findOverlaps(std::vector<Extent> extents, std::vector<Finding>& findings);

}  // namespace pellar
