// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "fixwell/host/pellar/ErrorCodes.h"

namespace pellar {

// How jobs end, beside the codes that a module knows.

/// Verified: damaged, and this kind of volume is not repaired here.
inline constexpr fixwell::ErrorCode kPLErrorDamagedForGood = -69712;

/// A repair of what is not repaired here, though it can be verified.
inline constexpr fixwell::ErrorCode kPLErrorNoRepairHere = -69740;
/// The medium, not the file system: places of the disk cannot be read.
inline constexpr fixwell::ErrorCode kPLErrorUnreadable = -69741;
/// The end of the volume is not on the disk.
inline constexpr fixwell::ErrorCode kPLErrorCutShort = -69742;

inline constexpr fixwell::ErrorCode kPLErrorNoPartitionMap = -69720;
inline constexpr fixwell::ErrorCode kPLErrorMapDamaged = -69721;      ///< a repair can restore it
inline constexpr fixwell::ErrorCode kPLErrorMapNeedsPerson = -69722;  ///< and none can
inline constexpr fixwell::ErrorCode kPLErrorMapNotRepaired = -69723;  ///< damage is left

inline constexpr fixwell::ErrorCode kPLErrorNoReferences = -69730;  ///< nothing could be compared
inline constexpr fixwell::ErrorCode kPLErrorPermissionsNotRepaired = -69731;  ///< some still differ

inline constexpr fixwell::ErrorCode kPLErrorNotAdministrator = -69732;  ///< only root may
/// The job needs more rights than the user has, and they were not given.
inline constexpr fixwell::ErrorCode kPLErrorNotAuthorized = -69733;

}  // namespace pellar
