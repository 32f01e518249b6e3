// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/disks/DiskClaim.h"
#include "pellar/disks/LoopDevice.h"
#include "pellar/process/Access.h"

#include <optional>
#include <variant>

namespace pellar {

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
    [[nodiscard]] static std::variant<DiskForTool, int> prepare(const DiskClaim& claim, Form form,
                                                                Access access);

    int descriptor() const { return loop_ ? loop_->descriptor() : descriptor_; }
    std::uint64_t offset() const { return offset_; }

private:
    DiskForTool(int descriptor, std::uint64_t offset) : descriptor_(descriptor), offset_(offset) {}

    int descriptor_;  // not owned
    std::uint64_t offset_;
    std::optional<LoopDevice> loop_;
};

}  // namespace pellar
