// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/privileges/HelperRequest.h"
#include "orvane/privileges/UndoneJob.h"
#include "pellar/disks/LoopDevice.h"
#include "pellar/process/FileDescriptor.h"

#include <variant>

namespace orvane {

using pellar::FileDescriptor;

/// The region of an image that a request names, made a device for as long as this lives.
class AttachedRegion {
public:
    /// `image` is the file as the asking program has it open; invalid where it has none. That
    /// program's way of opening it is the limit: what it may only read is attached to be read.
    [[nodiscard]] static std::variant<AttachedRegion, Undone> attach(const FileDescriptor& image,
                                                                     const HelperRequest& request);

    /// The request's disk, on the device.
    contract::DiskReference disk(const HelperRequest& request) const;

private:
    explicit AttachedRegion(pellar::LoopDevice device) : device_(std::move(device)) {}

    pellar::LoopDevice device_;
};

}  // namespace orvane
