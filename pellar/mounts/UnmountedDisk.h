// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/mounts/MountKeeper.h"
#include "pellar/mounts/MountPlace.h"
#include "pellar/texts/Sentence.h"

#include <optional>
#include <utility>
#include <variant>
#include <vector>

namespace pellar {

/// A disk that was unmounted for a job, and is mounted again where and as it was: at the latest
/// when this object goes, however the job ends, and also when this process is killed. It stays
/// unmounted where others have changed the place meanwhile. Any thread; unmounting writes back what
/// is still to be written, which may take long.
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
    UnmountedDisk(MountCalls calls, MountKeeper keeper)
        : calls_(std::move(calls)), mounted_(calls_.calls.size()), keeper_(std::move(keeper))
    {
    }

    MountCalls calls_;
    std::size_t mounted_;  ///< so many of them still are, the first ones
    /// Keeps the directories' numbers from going to others.
    std::vector<FileDescriptor> uncovered_;
    std::optional<MountKeeper> keeper_;
};

}  // namespace pellar
