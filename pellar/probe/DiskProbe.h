// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/bytes/Bytes.h"

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace pellar {

/// What a superblock says of itself, in the words of libblkid; empty where it says nothing.
struct Superblock {
    std::string usage;  ///< "filesystem", "raid", "crypto", "other"
    std::string type;   ///< "ext4", "vfat", "swap", "crypto_LUKS", ...
    std::string label;  ///< any bytes
    std::string uuid;
    std::string version;  ///< "FAT32", "1.0", ...
    /// There are several that disagree; then none of them is taken.
    bool isAmbivalent = false;

    /// Something that people keep files in.
    bool isFilesystem() const { return usage == "filesystem"; }
};

struct Partition {
    int number = 0;  ///< from 1; logical ones of an MBR from 5
    ByteRange range;
    bool isContainer = false;  ///< holds other partitions, not data
    std::string type;          ///< "0x83", or the GUID in small letters
    std::string name;          ///< of GPT; any bytes
};

struct PartitionTable {
    std::string type;  ///< "gpt", "dos", ...
    std::vector<Partition> partitions;
};

// Both only read, from any thread, and leave the descriptor open. Contents that make no sense count
// as none.

/// Nothing for an empty range. Ambiguous contents (signatures of two file systems) are nothing,
/// too: a guess could be the wrong one, and a tool let loose on it would destroy what is there.
[[nodiscard]] Superblock readSuperblock(int descriptor, ByteRange range);
/// Of a whole disk.
[[nodiscard]] std::optional<PartitionTable> readPartitionTable(int descriptor);

}  // namespace pellar
