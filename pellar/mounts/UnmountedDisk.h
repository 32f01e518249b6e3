// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/Sentence.h"
#include "pellar/mounts/MountKeeper.h"
#include "pellar/mounts/MountPlace.h"

#include <optional>
#include <utility>
#include <variant>
#include <vector>

namespace pellar {

/// A disk that was unmounted for a job, and is mounted again where and as it was: at the latest
/// when this object goes, however the job ends, and also when this process is killed. Any thread;
/// unmounting writes back what is still to be written, which may take long.
class UnmountedDisk {
public:
    /// Unmounts all the places, or none: why not, naming who holds it.
    [[nodiscard]] static std::variant<UnmountedDisk, Sentence> take(std::vector<MountPlace> places,
                                                                    const SystemPaths& paths);
    UnmountedDisk(UnmountedDisk&&) noexcept = default;
    UnmountedDisk& operator=(UnmountedDisk&&) = delete;
    ~UnmountedDisk() { static_cast<void>(mountAgain()); }

    /// What could not be mounted again, and why; empty when all is as before. Done once.
    [[nodiscard]] std::vector<Sentence> mountAgain();

private:
    explicit UnmountedDisk(MountKeeper keeper) : keeper_(std::move(keeper)) {}

    std::vector<MountCall> unmounted_;  ///< to be mounted again, in this order
    std::optional<MountKeeper> keeper_;
};

}  // namespace pellar
