// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/tools/Tool.h"

namespace pellar {

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
