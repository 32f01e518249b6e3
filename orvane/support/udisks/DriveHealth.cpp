// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/udisks/DriveHealth.h"

#include <algorithm>

namespace orvane {

bool isFailing(const DriveFacts& drive)
{
    const auto& warnings = drive.nvmeWarnings;
    return (drive.ata.updated != 0 && drive.ata.isFailing) ||
           std::any_of(warnings.begin(), warnings.end(),
                       [](const std::string& warning) { return warning != "temperature"; });
}

std::set<std::string> failingDevices(const std::vector<DriveFacts>& drives,
                                     const std::vector<DeviceOfDrive>& devices)
{
    std::set<std::string> failing;
    for (const DriveFacts& drive : drives)
        if (isFailing(drive))
            failing.insert(drive.object);
    std::set<std::string> nodes;
    for (const DeviceOfDrive& device : devices)
        if (failing.contains(device.drive))
            nodes.insert(device.node);
    return nodes;
}

}  // namespace orvane
