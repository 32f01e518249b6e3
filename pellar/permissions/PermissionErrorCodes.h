// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "fixwell/host/pellar/ErrorCodes.h"

namespace pellar {

// How a job on permissions ends, beside the codes that all jobs share.
inline constexpr fixwell::ErrorCode kPLErrorNoReferences = -69730;  ///< nothing could be compared
inline constexpr fixwell::ErrorCode kPLErrorPermissionsNotRepaired = -69731;  ///< some still differ
inline constexpr fixwell::ErrorCode kPLErrorNotAdministrator = -69732;        ///< only root may

}  // namespace pellar
