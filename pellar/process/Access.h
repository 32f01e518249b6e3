// SPDX-License-Identifier: Apache-2.0
#pragma once

namespace pellar {

/// What a run of a tool may do to the disk.
enum class Access { ReadOnly, ReadWrite };

}  // namespace pellar
