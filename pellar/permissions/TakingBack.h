// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/permissions/RecordedChange.h"
#include "pellar/permissions/Restoring.h"

#include <variant>

namespace pellar {

/// The file has what it had before.
struct PutBack {};

/// It has that already: it was never changed, or it was put back before.
struct AsBefore {};

/// Somebody has changed it since, or put another file in its place. Nothing was done.
struct ChangedSince {};

/// It lent rights before, and what it held then was not read. Nothing was done.
struct ContentsNotKnown {};

using TakingBack =
    std::variant<PutBack, AsBefore, Unseen, ChangedSince, ContentsNotKnown, NotPermitted>;

/// Gives a file what it had before a repair of permissions changed it, when it is the same object
/// and exactly as the repair left it. Where an interruption kept that from being known, it may be
/// anywhere on the way of the repair, but its contents must not have been changed since. In a
/// directory names may have come and gone. One that
/// lent rights gets them back only when its contents are those of then. Works on the object that
/// the path leads to, as `restore` does. `recordedRoot` is PermissionsRun::rootDevice. Needs root.
[[nodiscard]] TakingBack takeBack(const RootDirectory& root, std::uint64_t recordedRoot,
                                  const RecordedChange& change);

/// stat(2) of the root's directory; 0 when it fails.
[[nodiscard]] std::uint64_t deviceOf(const RootDirectory& root);

}  // namespace pellar
