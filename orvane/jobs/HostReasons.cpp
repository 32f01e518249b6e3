// SPDX-License-Identifier: Apache-2.0
#include "orvane/jobs/HostReasons.h"

namespace orvane {

std::string reasonOfHost(const Disk& disk, const pellar::Manager& library, const Translator& texts)
{
    if (disk.hasSMARTError())
        return texts.text("Not available because the drive says that it is failing.");
    if (!disk.isBootVolume() && !disk.containUserHomeDirectory())
        return {};
    const std::string why = library.reasonAgainstLive(disk.facts().filesystem);
    return why.empty() ? why
                       : texts.sentence("Not available because the disk is in use: %@.", {why});
}

}  // namespace orvane
