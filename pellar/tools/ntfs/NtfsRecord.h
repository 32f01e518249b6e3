// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/tools/ntfs/NtfsBootSector.h"

namespace pellar {

/// An attribute of a file's record; it points into the record.
struct NtfsAttribute {
    bool isResident = false;
    Bytes bytes;  ///< from its head on
    Bytes value;  ///< of a resident one
};

/// A record of the master file table, with its protection against half a write undone. None when
/// it cannot be read or was not written as a whole. Only the first records, which the system keeps
/// for itself and in one piece, are found so.
std::optional<std::vector<std::uint8_t>> readNtfsRecord(int descriptor, std::uint64_t offset,
                                                        const NtfsBootSector& sector,
                                                        std::uint64_t number);

/// The first attribute of this type; none when the record has none.
std::optional<NtfsAttribute> findNtfsAttribute(Bytes record, std::uint32_t type);

/// Undoes the protection of a block that begins with it: the last two bytes of each 512 are kept
/// in its head while it is on the disk. NO when it was not written as a whole.
bool undoNtfsProtection(std::vector<std::uint8_t>& block);

}  // namespace pellar
