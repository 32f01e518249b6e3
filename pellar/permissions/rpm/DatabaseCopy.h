// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/permissions/RootFiles.h"
#include "pellar/permissions/TemporaryDirectory.h"
#include "pellar/texts/Sentence.h"

#include <string>
#include <variant>

namespace pellar {

/// A copy of rpm's database in a directory of its own. rpm writes beside the database even when
/// it is only asked (a lock, SQLite's shared memory), which a verification must not, and on a
/// read-only volume cannot. As root it is given to the user that a program with reduced
/// rights runs as. Otherwise why there is none; an empty sentence when it was stopped.
[[nodiscard]] std::variant<TemporaryDirectory, Sentence> copyDatabase(const RootFiles& root,
                                                                      const std::string& database,
                                                                      const StopSwitch& stop);

}  // namespace pellar
