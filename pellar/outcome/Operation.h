// SPDX-License-Identifier: Apache-2.0
#pragma once

namespace pellar {

/// What the user asked for. A repair reads as well: it verifies what it has done.
enum class Operation { Verify, Repair };

}  // namespace pellar
