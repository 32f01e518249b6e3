// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "fixwell/host/pellar/ErrorCodes.h"

namespace pellar {

// How a job on a partition map ends, beside the codes that all jobs share.
inline constexpr fixwell::ErrorCode kPLErrorNoPartitionMap = -69720;
inline constexpr fixwell::ErrorCode kPLErrorMapDamaged = -69721;      ///< a repair can restore it
inline constexpr fixwell::ErrorCode kPLErrorMapNeedsPerson = -69722;  ///< and none can
inline constexpr fixwell::ErrorCode kPLErrorMapNotRepaired = -69723;  ///< damage is left

}  // namespace pellar
