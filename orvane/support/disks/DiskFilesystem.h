// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/support/OVDisk.h"

#include <functional>
#include <string>
#include <string_view>
#include <utility>

namespace orvane {

/// What the installed tools can do for one type of file system.
struct FilesystemCapabilities {
    bool canVerify = false;
    bool canRepair = false;
    bool canVerifyLive = false;
};

/// Asked on the main thread, with the type as libblkid names it.
using CapabilityLookup = std::function<FilesystemCapabilities(std::string_view filesystemType)>;

/// A file system type with what can be done for it, asked anew each time: a tool may be installed
/// while the program runs.
class DiskFilesystem final : public contract::OVFilesystem {
public:
    DiskFilesystem(std::string type, CapabilityLookup capabilities)
        : type_(std::move(type)), capabilities_(std::move(capabilities))
    {
    }

    std::string filesystemType() const override { return type_; }
    bool canBeRepaired() const override { return capabilities_(type_).canRepair; }
    bool canBeVerified() const override { return capabilities_(type_).canVerify; }
    bool supportsLiveVerify() const override { return capabilities_(type_).canVerifyLive; }

private:
    std::string type_;
    CapabilityLookup capabilities_;
};

}  // namespace orvane
