// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "fixwell/host/pellar/ErrorCodes.h"

namespace pellar {

/// The job needs more rights than the user has, and they were not given.
inline constexpr fixwell::ErrorCode kPLErrorNotAuthorized = -69733;

}  // namespace pellar
