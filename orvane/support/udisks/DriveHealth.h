// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <set>
#include <string>
#include <vector>

namespace orvane {

/// What a drive says of itself, as UDisks2 passes it on.
struct DriveFacts {
    /// "SmartUpdated" and "SmartFailing" of org.freedesktop.UDisks2.Drive.Ata.
    struct Ata {
        std::uint64_t updated = 0;  ///< seconds since the Epoch; 0: never read
        bool isFailing = false;
    };

    std::string object;
    Ata ata;
    std::vector<std::string> nvmeWarnings;  ///< "SmartCriticalWarning" of an NVMe.Controller
};

/// A device node and the drive that it is on; "/" for none.
struct DeviceOfDrive {
    std::string node;
    std::string drive;
};

/// A drive that is merely hot is not failing, and what was never read says nothing.
[[nodiscard]] bool isFailing(const DriveFacts& drive);

/// The nodes of those devices, whole or parts, whose drive is failing.
[[nodiscard]] std::set<std::string> failingDevices(const std::vector<DriveFacts>& drives,
                                                   const std::vector<DeviceOfDrive>& devices);

}  // namespace orvane
