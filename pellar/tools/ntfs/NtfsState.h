// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/tools/ntfs/NtfsBootSector.h"

namespace pellar {

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
