// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/DiskScan.h"

#include "orvane/support/settings/XDGPaths.h"

#include <system_error>
#include <utility>

namespace orvane::desktop {
namespace {

std::vector<DiskTree> readDisks(DiskReader& reader)
{
    DiskSources sources;
    sources.homeDirectory = environmentValue("HOME").value_or("");
    return reader.read(sources);
}

}  // namespace

DiskScan::~DiskScan()
{
    *liveness_ = nullptr;
}

void DiskScan::start()
{
    if (std::exchange(isScanning_, true)) {
        mustScanAgain_ = true;
        return;
    }
    const auto scan = [&loop = loop_, &reader = reader_, scan = liveness_] {
        loop.post([scan, disks = readDisks(reader)] {
            if (*scan != nullptr)
                (*scan)->finish(disks);
        });
    };
    try {
        thread_ = std::jthread(scan);
    } catch (const std::system_error&) {
        finish(readDisks(reader_));
    }
}

void DiskScan::finish(const std::vector<DiskTree>& disks)
{
    isScanning_ = false;
    const bool mustScanAgain = std::exchange(mustScanAgain_, false);
    finished_(disks);
    if (mustScanAgain)
        start();
}

}  // namespace orvane::desktop
