// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/mounts/MountPoint.h"
#include "pellar/mounts/MountTable.h"
#include "pellar/outcome/Result.h"

#include <string>
#include <vector>

namespace pellar {

/// All that it takes to mount a place again as it was, but where that is. Made ready beforehand,
/// because `perform` may have to run where nothing else can.
struct MountCall {
    std::string source;  ///< the device; of a bind mount the way from the root of the file system
    std::string target;  ///< as the user knows it
    std::string filesystem;
    std::string data;         ///< the file system's own options
    unsigned long flags = 0;  ///< of mount(2)
    bool isBind = false;
};

/// The places of one disk, in the order in which they were mounted.
struct MountCalls {
    std::vector<MountCall> calls;
    std::vector<MountPoint> points;
    std::size_t whole = MountPoint::none;  ///< which shows all of the file system, for bind mounts
};

/// Keeps hold of where the places are. Needs the right to mount.
[[nodiscard]] Result<MountCalls, NotHeld> mountCallsFor(const std::vector<Mount>& places);

/// Mounts one of them; 0, or an errno value: ESTALE when its place is another now. Allocates
/// nothing and may run in a forked child (signal-safety(7)).
[[nodiscard]] int perform(const MountCalls& calls, std::size_t index) noexcept;

/// Whether what shows at the place is none of these, the places of one disk: who unmounts it by its
/// path unmounts another. NO when it is not known.
[[nodiscard]] bool isCovered(const Mount& place, const std::vector<Mount>& places);

}  // namespace pellar
