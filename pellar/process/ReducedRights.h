// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/process/FileDescriptor.h"

#include <sys/types.h>

#include <filesystem>

namespace pellar {

/// The user and group of a process that root starts with reduced rights: nobody.
inline constexpr uid_t userOfReduced = 65534;
inline constexpr gid_t groupOfReduced = 65534;

/// What a process may use that reads what strangers wrote.
struct ReducedLimits {
    unsigned long addressSpace = 4UL << 30U;  ///< bytes
    unsigned long processorTime = 60UL * 60;  ///< seconds
    unsigned long fileBytes = 512UL << 20U;   ///< of each file that it writes
    unsigned long descriptors = 256;
};

/// In a forked child, which gets none of its rights back: root becomes nobody, no program that it
/// starts has more (PR_SET_NO_NEW_PRIVS), it leaves no core, and is killed when the thread that
/// forked it ends. NO when any of it fails. Safe after a fork (signal-safety(7)).
[[nodiscard]] bool reduceRights(const ReducedLimits& limits) noexcept;

/// A rule by which nothing can be written, made or removed but below this directory (Landlock);
/// none where the kernel has no such rules. Made before the fork.
[[nodiscard]] FileDescriptor ruleForWritingBelow(const std::filesystem::path& directory);

/// After reduceRights. Safe after a fork.
[[nodiscard]] bool obeyRule(int rule) noexcept;

}  // namespace pellar
