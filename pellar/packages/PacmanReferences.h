// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/packages/Reference.h"
#include "pellar/packages/RootDirectory.h"

namespace pellar {

/// What the packages of a pacman system say about their files: var/lib/pacman/local has a
/// mtree(5) for each. None when it was stopped.
[[nodiscard]] std::optional<References> readPacmanReferences(const RootFiles& root,
                                                             const ReadingProgress& progress);

}  // namespace pellar
