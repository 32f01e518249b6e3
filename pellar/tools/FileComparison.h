// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/bytes/Bytes.h"
#include "pellar/outcome/FileChange.h"

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace pellar {

/// A volume as it was before a repair, and as it is behind it. Both are open for reading.
struct RepairedVolume {
    int before = -1;
    std::uint64_t offset = 0;  ///< where in `before` the volume starts, bytes
    int after = -1;
    std::uint64_t bytes = 0;  ///< of the volume
};

/// How the files of a volume before and behind a repair are compared, where we can read them
/// ourselves, and how a tool is asked for their names.
struct FileComparison {
    /// Those of which the volume's own books differ in one of the ranges, which are in ascending
    /// order; without names. Nothing where it cannot be known. One that has no size
    /// before was a file only if a name leads there.
    std::vector<FileChange> (*changes)(const RepairedVolume& volume,
                                       const std::vector<ByteRange>& differences);
    std::string_view program;
    /// `disk` is a name that the tool can open, `offset` is where in it the volume starts.
    std::vector<std::string> (*arguments)(const std::string& disk, std::uint64_t offset,
                                          const std::vector<FileChange>& files);
    /// Of a line of what it prints: the inode and the name.
    std::optional<FileChange> (*nameIn)(std::string_view line);
};

}  // namespace pellar
