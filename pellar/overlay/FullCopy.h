// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/overlay/WorkingCopy.h"

#include <functional>
#include <memory>

namespace pellar {

/// A copy of a region of an image file: for a system that cannot show an overlay to a tool. Where
/// the file system can do that it shares the blocks with the image (ioctl_ficlonerange(2)), else
/// the image's holes are left out.
class FullCopy final : public WorkingCopy {
public:
    /// `disk` outlives it, open for reading. An errno: ENOTSUP for a device, ENOSPC where all of it
    /// would not find room, EIO where it cannot be read, ECANCELED when it was stopped.
    [[nodiscard]] static Result<std::unique_ptr<FullCopy>, int> of(
        int disk, ByteRange region, const OverlayRoom& room,
        const std::function<bool()>& isStopped);

    /// What a tool is given, open for reading and writing.
    int descriptor() const { return file_.get(); }

    std::uint64_t bytes() const override { return region_.length; }
    [[nodiscard]] int read(std::uint64_t start, std::span<std::uint8_t> bytes) override;
    [[nodiscard]] Result<std::vector<ByteRange>, int> differences() override;
    std::optional<std::uint64_t> firstUnreadable() const override { return std::nullopt; }
    bool isOutOfRoom() const override { return roomBeside(file_.get()) == 0; }

private:
    FullCopy(int disk, ByteRange region, FileDescriptor file)
        : disk_(disk), region_(region), file_(std::move(file))
    {
    }

    const int disk_;
    const ByteRange region_;
    const FileDescriptor file_;
};

}  // namespace pellar
