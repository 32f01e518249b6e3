// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/process/FileDescriptor.h"

#include <sys/types.h>

#include <cstdint>
#include <filesystem>
#include <optional>
#include <string>
#include <string_view>

namespace orvane {

using pellar::FileDescriptor;

/// Which disk is meant, beside its name: between the question for a password and the answer, the
/// name may have passed to another one.
struct DiskIdentity {
    dev_t device = 0;            ///< none: no disk is meant
    std::uint64_t sequence = 0;  ///< the kernel's, never given twice; 0: not known
    std::string uuid;            ///< of the file system; empty: not known, or none

    /// "8:17:5:6bd0…", and back; none for what is no such text.
    std::string text() const;
    static std::optional<DiskIdentity> fromText(std::string_view text);

    /// What is known of both does not differ. A superblock that can no longer be read says nothing:
    /// it may be why the disk is to be repaired.
    bool isStill(const DiskIdentity& now) const;

    friend bool operator==(const DiskIdentity&, const DiskIdentity&) = default;
};

/// Of the device with this node, from what the kernel and udev tell everybody; without a device
/// where there is none.
[[nodiscard]] DiskIdentity identityOf(const std::filesystem::path& node);

/// Of an open block device; its superblock is read.
[[nodiscard]] DiskIdentity identityOf(const FileDescriptor& device);

}  // namespace orvane
