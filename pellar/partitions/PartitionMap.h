// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/partitions/GPT.h"
#include "pellar/partitions/MBR.h"

#include <optional>
#include <string>

namespace pellar {

/// One of the two copies of a GUID partition table, as far as it can be read.
struct GPTCopy {
    enum class EntriesFault { None, NotRead, Unreadable, WrongChecksum };

    HeaderReading header;
    EntriesFault entriesFault = EntriesFault::NotRead;
    Bytes entries;  ///< without the rest of their last sector; empty unless there is no fault

    bool isGood() const
    {
        return header.fault == HeaderFault::None && entriesFault == EntriesFault::None;
    }
};

/// All that there is to be known of a disk's partition map.
struct PartitionMap {
    enum class Kind { None, MBR, GPT };

    Kind kind = Kind::None;
    std::uint32_t sectorBytes = 0;
    std::uint64_t sectorCount = 0;
    /// What fills the whole disk, by libblkid's name; empty when nothing does.
    std::string wholeSignature;

    MBRSector boot;
    MBRPartitions mbr;  ///< of an MBR only
    GPTCopy primary;
    GPTCopy backup;
    std::optional<std::uint64_t> unreadableSector;  ///< the first of those that were looked for
    std::uint64_t backupPlace = 0;  ///< where the backup's header was looked for last

    std::uint64_t lastSector() const { return sectorCount - 1; }
    /// The copy that counts: the primary where it is good. Null when neither is.
    const GPTCopy* validCopy() const;
    /// Both copies are good, and the backup is the disk's last sector.
    bool hasCopiesInPlace() const;
};

/// Reads the map, from a few sectors at the start and the end of the disk.
[[nodiscard]] PartitionMap readPartitionMap(const Sectors& disk, std::string wholeSignature);

/// A header of a GUID partition table stands at the start or the end, whether or not it is sound.
[[nodiscard]] bool hasGPTHeader(const Sectors& sectors);

}  // namespace pellar
