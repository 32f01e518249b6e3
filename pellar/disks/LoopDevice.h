// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/outcome/Result.h"
#include "pellar/process/Command.h"
#include "pellar/process/FileDescriptor.h"
#include "pellar/process/KernelFiles.h"

#include <sys/types.h>

#include <cstdint>
#include <filesystem>
#include <optional>
#include <string>

namespace pellar {

/// A loop device as it was just set up, still open, and its name ("loop0").
struct NewLoopDevice {
    FileDescriptor device;
    std::string name;
};

/// When the kernel takes a loop device down by itself: when nobody has it open any more
/// (LO_FLAGS_AUTOCLEAR), or never; its partitions are looked for then (LO_FLAGS_PARTSCAN).
enum class LoopLife { UntilClosed, UntilDetached };

/// A region of a file as a block device, where a `length` of 0 reaches to the end. An errno when
/// the kernel refuses: EACCES without the right to, ENOENT where there is no /dev/loop-control,
/// EINVAL for a region that does not begin at a sector of 512 bytes. The device is read-only for
/// Access::ReadOnly, whoever opens it.
[[nodiscard]] Result<NewLoopDevice, int> setUpLoop(int file, std::uint64_t offset,
                                                   std::uint64_t length, Access access,
                                                   LoopLife life);

/// A region of a file, or of a disk, as a block device of its own, for tools that cannot be told
/// where a volume begins (loop(4)). Needs the right to set up loop devices.
///
/// The kernel takes the device down when nobody has it open any more (LO_FLAGS_AUTOCLEAR), so none
/// is left behind, however the process ends. Another program that looks at all disks may have it
/// open for a moment: giving it back waits for that, a second at most.
class LoopDevice {
public:
    /// An errno as setUpLoop; EINVAL as well for a region of less than a sector.
    [[nodiscard]] static Result<LoopDevice, int> attach(int file, std::uint64_t offset,
                                                        std::uint64_t length, Access access);

    LoopDevice(LoopDevice&&) = default;
    LoopDevice& operator=(LoopDevice&&) = delete;
    /// What was written through the device is in the file when it is gone.
    ~LoopDevice();

    int descriptor() const { return device_.get(); }
    const std::filesystem::path& node() const { return node_; }

private:
    LoopDevice(FileDescriptor device, const std::string& name);

    FileDescriptor device_;
    std::filesystem::path node_;   ///< "/dev/loop0"
    std::filesystem::path place_;  ///< where the kernel tells what is behind the device
    std::optional<std::string> behind_;
};

/// The node of a loop device that is set up on this file, wherever in it; empty when there is none.
std::string loopDeviceOn(dev_t fileDevice, ino_t fileNumber, const SystemPaths& paths);

}  // namespace pellar
