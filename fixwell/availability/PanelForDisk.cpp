// SPDX-License-Identifier: Apache-2.0
#include "fixwell/module/OVFXW.h"

namespace fixwell {
namespace {

constexpr std::int64_t placeholderDiskNumber = 1'000'000'001;

bool isOfferedForOptical(const OVDiskPointer& disk)
{
    if (!disk)
        return true;
    if (disk->isDVDRAM())
        return true;
    return !disk->hasBlankOpticalMedia() && disk->diskNumber() != placeholderDiskNumber;
}

}  // namespace

bool OVFXW::displayPanelForDiskTypeAndDisk(std::int32_t type, const OVDiskPointer& disk)
{
    switch (type) {
        case 1:
        case 2:
        case 3:
        case 4:
        case 5:
        case 6:
        case 8:
        case 12: return true;
        case 15: return isOfferedForOptical(disk);
        default: return false;
    }
}

bool OVFXW::supportsContextMenuForDiskTypeSelectedDisk(std::int32_t type, const OVDiskPointer& disk)
{
    return displayPanelForDiskTypeAndDisk(type, disk);
}

}  // namespace fixwell
