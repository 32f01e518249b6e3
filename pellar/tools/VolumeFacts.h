// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/disks/Readability.h"

#include <cstdint>
#include <optional>
#include <string_view>
#include <vector>

namespace pellar {

/// What we have seen of a volume ourselves.
struct VolumeFacts {
    bool isRecognized = false;  ///< it is of a kind that the tool treats
    bool hasPrimary = false;    ///< the main superblock is in its place
    bool isForeign = false;     ///< something else claims the place: nothing may be written
    bool needsRecovery = false;
    std::uint64_t log = 0;          ///< where a log is that has to be read apart; 0 for none
    bool isMarkedDirty = false;     ///< it says itself that it was not properly unmounted
    std::uint64_t volumeBytes = 0;  ///< 0 when not known
    std::uint64_t availableBytes = 0;
    std::uint64_t blockBytes = 0;  ///< of the blocks that its tool counts in; 0 when it does not
    bool differsFromBackup =
        false;  ///< the two copies of the main superblock contradict each other
    std::optional<std::uint64_t> files;  ///< by its own books, where these agree with each other
    std::vector<ByteRange> backups;      ///< what a repair uses and a verification does not read

    bool isCutShort() const { return volumeBytes > availableBytes; }
};

/// Whether anything speaks against `filesystemType` (libblkid's name) in a region where our own
/// reading has found (`isRecognized`) or missed it: then nothing may be written there, and what is
/// said about it would be about something else. Where the main superblock is lost, libblkid
/// finds nothing, and a backup superblock is the witness.
bool isForeignTo(std::string_view filesystemType, bool isRecognized, int disk, std::uint64_t offset,
                 std::uint64_t availableBytes);

/// The facts of a volume by what has been read of its superblock, an optional with `isBackup` in
/// it.
template <class Superblock>
VolumeFacts factsFrom(const Superblock& superblock, std::string_view filesystemType, int disk,
                      std::uint64_t offset, std::uint64_t availableBytes)
{
    VolumeFacts facts;
    facts.availableBytes = availableBytes;
    facts.isRecognized = superblock.has_value();
    facts.hasPrimary = superblock && !superblock->isBackup;
    facts.isForeign = isForeignTo(filesystemType, facts.isRecognized, disk, offset, availableBytes);
    return facts;
}

}  // namespace pellar
