// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/mounts/MountPlace.h"

#include <cstdint>
#include <string>
#include <vector>

namespace pellar {

/// All that mount(2) needs to be told. Made ready beforehand, because `perform` may have to run
/// where nothing else can.
struct MountCall {
    std::string source;
    std::string target;
    std::string filesystem;
    std::string data;         ///< the file system's own options
    unsigned long flags = 0;  ///< of mount(2)
    bool isBind = false;
    std::uint64_t below = 0;  ///< the mount that shows at the target when this one is gone

    friend bool operator==(const MountCall&, const MountCall&) = default;
};

/// What mounts a place again as it was. `wholeTarget`: where all of its file system is mounted, for
/// a place that shows only a part.
[[nodiscard]] MountCall mountCallFor(const MountPlace& place, const std::string& wholeTarget);

/// Mounts; 0, or an errno value. The directory is made when it is gone: whoever had made it may
/// have taken it away with the mount. Allocates nothing and may run in a forked child
/// (signal-safety(7)).
[[nodiscard]] int perform(const MountCall& call) noexcept;

/// Whether it is mounted (still, or again): something is, and it is not what lay below. As
/// `perform`.
[[nodiscard]] bool isMounted(const MountCall& call) noexcept;

/// Whether what shows at the place is none of these, the places of one disk: who unmounts it by its
/// path unmounts another. NO when it is not known.
[[nodiscard]] bool isCovered(const MountPlace& place, const std::vector<MountPlace>& places);

}  // namespace pellar
