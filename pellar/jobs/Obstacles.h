// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/outcome/Outcome.h"
#include "pellar/tools/Tool.h"

namespace pellar {

// What it means that the kernel would not do what a run needs; `error` is an errno.

/// The volume could not be made a disk of its own for the tool.
Judgement notAttached(const Tool& tool, int error);

/// The log could not be replayed.
Outcome notReplayed(int error);

}  // namespace pellar
