// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/bytes/Bytes.h"

namespace pellar {

/// What we read ourselves of an NTFS volume (Linux, Documentation/filesystems/ntfs.rst, and the
/// fields that the boot sector has kept since Windows NT).
struct NtfsBootSector {
    static constexpr std::size_t size = 512;

    std::uint64_t volumeBytes = 0;  ///< with the backup behind its end
    std::uint32_t sectorBytes = 0;
    std::uint64_t clusterBytes = 0;
    std::uint64_t fileTablePlace = 0;  ///< of the master file table, bytes from the start
    std::uint32_t fileRecordBytes = 0;
    bool isBackup = false;

    friend bool operator==(const NtfsBootSector&, const NtfsBootSector&) = default;
};

/// The boot sector of the volume that starts at `offset`, or its backup in the last sector.
std::optional<NtfsBootSector> readNtfsBootSector(int descriptor, std::uint64_t offset,
                                                 std::uint64_t availableBytes);

/// Whether the backup, in the sector behind the volume's last, can be read and is none, or tells of
/// another volume than `sector`, the one in front.
bool differsFromNtfsBackup(int descriptor, std::uint64_t offset, const NtfsBootSector& sector);

/// Whether the volume's own record says that it was not properly unmounted or is to be checked by
/// its own system. None when the record cannot be read.
std::optional<bool> isNtfsMarkedDirty(int descriptor, std::uint64_t offset,
                                      const NtfsBootSector& sector);

/// Whether the journal ($LogFile) holds changes that its own system has still to bring to their
/// places: the newer of its two restart pages names a client, and does not call the volume clean
/// (Linux, fs/ntfs3/fslog.c: RESTART_HDR, RESTART_AREA). NO for an emptied journal; none when it
/// cannot be read.
std::optional<bool> hasNtfsJournalWaiting(int descriptor, std::uint64_t offset,
                                          const NtfsBootSector& sector);

}  // namespace pellar
