// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/bytes/Bytes.h"
#include "pellar/outcome/Task.h"

#include <sys/types.h>

#include <algorithm>
#include <chrono>
#include <filesystem>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace pellar {

/// Which disk was repaired.
struct RecordedDisk {
    std::filesystem::path path;  ///< canonical, of the device node or the image
    std::uint64_t offset = 0;    ///< bytes, of the region within it
    std::uint64_t length = 0;    ///< bytes, of the region
    std::string uuid;            ///< of the file system; empty when it has none
    std::string filesystem;      ///< as libblkid names it; empty when unknown
    std::string name;            ///< what the user calls the disk; any bytes

    friend bool operator==(const RecordedDisk&, const RecordedDisk&) = default;
};

/// Which repair it was.
struct RecordedRepair {
    RecordedDisk disk;
    Task task;
    uid_t user = 0;                              ///< who asked for it
    std::chrono::system_clock::time_point time;  ///< kept in whole seconds

    friend bool operator==(const RecordedRepair&, const RecordedRepair&) = default;
};

/// Sorts what a list shows of records, each with an `id`, by their repairs' times.
template <class Record, class RepairOf>
void sortNewestFirst(std::vector<Record>& records, const RepairOf& repairOf)
{
    std::ranges::sort(records, [&repairOf](const Record& a, const Record& b) {
        const auto aTime = repairOf(a).time;
        const auto bTime = repairOf(b).time;
        return aTime != bTime ? aTime > bTime : a.id > b.id;
    });
}

enum class RecordState {
    Applying,  ///< the bytes after are being written: each byte is as before or as after
    Applied,   ///< all ranges are as after
    Undoing,   ///< the bytes before are being written: each byte is as before or as after
};

/// What a record says of itself. The digests are SHA-256, hexadecimal.
struct RecordFacts {
    RecordedRepair repair;
    RecordState state = RecordState::Applying;
    std::uint64_t rangeCount = 0;
    std::uint64_t changedBytes = 0;  ///< of all ranges together
    std::string rangesDigest;        ///< of the ranges as `encodeRanges` writes them
    std::string beforeDigest;        ///< of the bytes before, all ranges' one after the other
    std::string afterDigest;

    friend bool operator==(const RecordFacts&, const RecordFacts&) = default;
};

/// The most bytes that the facts may take.
inline constexpr std::size_t largestFacts = 64U << 10U;

/// JSON with its own checksum in the first line.
[[nodiscard]] std::string encodeFacts(const RecordFacts& facts);
/// None unless the checksum, the schema version and every value are as they should be.
[[nodiscard]] std::optional<RecordFacts> decodeFacts(std::string_view text);

/// There is one at least, none is empty, each begins behind the end of the one before it, and the
/// last ends within `length`.
[[nodiscard]] bool areInOrder(const std::vector<ByteRange>& ranges, std::uint64_t length);

inline constexpr std::size_t encodedRangeBytes = 16;

/// Offset and length, little endian, 8 bytes each.
[[nodiscard]] Bytes encodeRanges(const std::vector<ByteRange>& ranges);
[[nodiscard]] std::vector<ByteRange> decodeRanges(ByteView bytes);

}  // namespace pellar
