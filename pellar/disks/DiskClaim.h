// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/pellar/DiskReference.h"
#include "contract/pellar/ErrorCodes.h"
#include "pellar/disks/LoopDevice.h"
#include "pellar/outcome/Result.h"
#include "pellar/process/Command.h"
#include "pellar/process/FileDescriptor.h"
#include "pellar/process/KernelFiles.h"

#include <cstdint>
#include <filesystem>
#include <optional>
#include <variant>

namespace pellar {

/// A disk that is ours for the length of a job: opened once, locked against other users of
/// flock(2), and found neither mounted nor attached. Everything that follows goes through the one
/// descriptor, so it is the same disk to the end whatever happens to its name.
class DiskClaim {
public:
    /// A device that somebody has locked, perhaps only for a moment: the device manager does while
    /// it looks at one, as it does after each unmounting (systemd, "Locking Block Device Access").
    struct Locked {};

    /// An error code when the disk is in use (kPLErrorCouldNotUnmount: mounted;
    /// kPLErrorDiskInUse: held by the kernel, or an image that is locked or attached as a loop
    /// device), when it cannot be opened, or is no disk at all. Does not wait.
    [[nodiscard]] static std::variant<DiskClaim, contract::ErrorCode, Locked> attempt(
        const contract::DiskReference& disk, Access access, const SystemPaths& paths);
    /// The same; a locked device is waited for, a second at most, and is then in use.
    [[nodiscard]] static Result<DiskClaim, contract::ErrorCode> take(
        const contract::DiskReference& disk, Access access, const SystemPaths& paths);

    int descriptor() const { return disk_.get(); }
    std::uint64_t offset() const { return offset_; }
    /// Bytes that are really there, from `offset` to the end of the region or the file.
    std::uint64_t availableBytes() const { return availableBytes_; }

    /// The volume takes all of the file or device, from its first byte to its last.
    bool isAllOfIt() const { return isAllOfIt_; }
    bool isBlockDevice() const;

    /// NO when the disk has become shorter since it was claimed.
    bool isStillWhole() const;
    /// NO when its last byte cannot be read, or no longer.
    bool isEndReadable() const;
    /// NO when the name no longer leads to the disk that was claimed: an image was deleted, moved
    /// or replaced, a device went away. What was found is then true of nothing that is left.
    bool isStillInPlace() const;

private:
    DiskClaim(FileDescriptor disk, std::filesystem::path path, std::uint64_t offset,
              std::uint64_t length);

    FileDescriptor disk_;
    std::filesystem::path path_;
    std::uint64_t offset_;
    std::uint64_t availableBytes_;
    bool isAllOfIt_;
};

/// A claimed disk as a tool is given it, for one run: itself, or, for a volume inside something
/// larger and a tool that cannot be told where, a loop device on the volume alone. The claim
/// outlives it.
class DiskForTool {
public:
    enum class Form {
        Itself,       ///< as it is; the volume begins at `offset`
        VolumeAlone,  ///< as something that holds the volume and nothing else
        BlockDevice,  ///< the same, and never a file: what the kernel is to open itself
    };

    /// An errno when there is no loop device to be had (LoopDevice::attach).
    [[nodiscard]] static Result<DiskForTool, int> prepare(const DiskClaim& claim, Form form,
                                                          Access access);
    /// The same of a file that holds the volume and nothing else, which outlives it.
    [[nodiscard]] static Result<DiskForTool, int> prepare(int file, std::uint64_t bytes, Form form,
                                                          Access access);

    int descriptor() const { return loop_ ? loop_->descriptor() : descriptor_; }
    std::uint64_t offset() const { return offset_; }

private:
    DiskForTool(int descriptor, std::uint64_t offset) : descriptor_(descriptor), offset_(offset) {}
    static Result<DiskForTool, int> onLoop(int file, std::uint64_t offset, std::uint64_t bytes,
                                           Access access);

    int descriptor_;  // not owned
    std::uint64_t offset_;
    std::optional<LoopDevice> loop_;
};

}  // namespace pellar
