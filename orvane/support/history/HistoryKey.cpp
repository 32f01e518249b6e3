// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/history/HistoryKey.h"

namespace orvane {

std::string historyKeyOf(const DiskFacts& disk, bool sharesUUID)
{
    if (disk.uuid.empty())
        return "disk:" + disk.identifier + "@" + std::to_string(disk.offset);
    const bool isInImage = disk.storage == contract::DiskReference::Storage::FileRegion;
    if (isInImage || sharesUUID)
        return "uuid:" + disk.uuid + "@" + disk.identifier;
    return "uuid:" + disk.uuid;
}

}  // namespace orvane
