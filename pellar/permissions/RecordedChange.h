// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/permissions/Inspection.h"
#include "pellar/undo/RecordFacts.h"

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace pellar {

/// Since 1970 (stat(2)).
struct Moment {
    std::int64_t seconds = 0;
    std::int64_t nanoseconds = 0;

    friend bool operator==(const Moment&, const Moment&) = default;
};

/// A file at one moment. Whatever is done to it changes `changed`, which nobody can set.
struct FileState {
    Permissions permissions;
    Moment changed;   ///< of the inode (ctime)
    Moment modified;  ///< of the contents (mtime)

    friend bool operator==(const FileState&, const FileState&) = default;
};
FileState stateOf(const Permissions& permissions, const struct stat& status);

/// How far the change of a file has come.
enum class ChangeStage {
    Beginning,   ///< it may be as before, as wanted, or on the way
    Changed,     ///< it was left as `after`
    TakingBack,  ///< it may be as after, as before, or on the way
    Settled,     ///< there is nothing to take back, or nothing any more
};

/// What a repair of permissions has done to a file.
struct RecordedChange {
    std::string path;  ///< from the root on; any bytes
    std::uint64_t device = 0;
    std::uint64_t inode = 0;
    FileState before;
    Permissions wanted;
    /// SHA-256 of the contents, of a file that lent rights before; empty when they were not read.
    std::string digest;
    ChangeStage stage = ChangeStage::Beginning;
    std::optional<FileState> after;  ///< once it was Changed

    friend bool operator==(const RecordedChange&, const RecordedChange&) = default;
};

/// What is known of a file that is going to get what its reference says; reads the contents of one
/// that lends rights.
RecordedChange changeOf(const Reference& reference, const FoundFile& file);

/// Whether a file that is so lends rights to those who run it.
bool lendsRights(const Permissions& permissions);

/// Which run of a repair it was.
struct PermissionsRun {
    RecordedRepair repair;
    std::string mountPoint;
    std::uint64_t rootDevice = 0;  ///< stat(2) of the mount point; may be another the next time

    friend bool operator==(const PermissionsRun&, const PermissionsRun&) = default;
};

// A record is a text. Each line has its checksum and stands for itself, so that one which is cut
// off or damaged costs no other.

std::string lineOfRun(const PermissionsRun& run);
/// The file is known by its number in the record from now on.
std::string lineOfChange(std::uint64_t number, const RecordedChange& change);
/// `after` is there when the stage is Changed.
std::string lineOfStage(std::uint64_t number, ChangeStage stage,
                        const std::optional<FileState>& after = {});

struct DecodedRecord {
    PermissionsRun run;
    std::vector<RecordedChange> changes;  ///< by their numbers
    std::uint64_t damagedLines = 0;       ///< but not one that was cut off at the end
};

/// None when it is not known of which run it is.
[[nodiscard]] std::optional<DecodedRecord> decodeRecord(std::string_view text);

}  // namespace pellar
