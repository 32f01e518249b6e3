// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/tools/FileComparison.h"

namespace pellar {

/// How files of ext2, ext3 and ext4 are compared, and named by debugfs(8). Nothing is said of a
/// volume with a journal that waits to be replayed: what it would have taken away or shortened is
/// no loss.
[[nodiscard]] const FileComparison& extFiles();

}  // namespace pellar
