// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/disks/Disk.h"
#include "orvane/support/udisks/Refusal.h"

#include <filesystem>
#include <optional>
#include <string>
#include <vector>

namespace orvane {

enum class DiskAction { Mount, Unmount, Eject, Attach, Detach };

/// One thing that is done to a device by its node, or to an image file by its path.
struct DiskStep {
    enum class Kind { Mount, Unmount, Eject, DetachLoop, Attach };

    Kind kind;
    std::string node;

    friend bool operator==(const DiskStep&, const DiskStep&) = default;
};

/// What has to be done, in this order, until a step fails. Plain: may go to another thread.
struct DiskRequest {
    DiskAction action = DiskAction::Mount;
    std::string identifier;  ///< of the disk; of a drive's whole disk when it is ejected
    std::string name;        ///< printable
    std::vector<DiskStep> steps;
};

// Main thread, as all of Disk.

/// Why the action makes no sense for a disk; none when it does. A volume of a device that is not
/// mounted is mounted, one that is, but not as the system's root, unmounted. A device that does not
/// hold the system's root, or any part of one, is ejected, or detached where it is an image.
[[nodiscard]] std::optional<Refusal> objectionTo(DiskAction action, const Disk& disk);
[[nodiscard]] inline bool isPossible(DiskAction action, const Disk& disk)
{
    return !objectionTo(action, disk);
}

/// What is mounted of a drive is unmounted before it is ejected. Asked only where it is possible.
[[nodiscard]] DiskRequest requestFor(DiskAction action, const Disk& disk);
/// An image file, to be written as well where this user may.
[[nodiscard]] DiskRequest requestToAttach(const std::filesystem::path& image);

/// "cannot mount “NAME”: REASON", in the user's language.
[[nodiscard]] std::string failureText(const DiskRequest& request, const Refusal& refusal,
                                      const Translator& texts);

}  // namespace orvane
