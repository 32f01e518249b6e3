// SPDX-License-Identifier: Apache-2.0
#include "orvane/jobs/UnavailableReason.h"

namespace orvane {

std::string whyUnavailable(const Disk& disk, const pellar::Manager& library,
                           const Translator& texts)
{
    if (disk.hasSMARTError())
        return texts.text("Not available because the drive says that it is failing.");
    if (!disk.isBootVolume() && !disk.containUserHomeDirectory())
        return {};
    const std::string why = library.reasonAgainstLive(disk.facts().filesystem);
    return why.empty() ? why
                       : texts.sentence("Not available because the disk is in use: %@.", {why});
}

std::string whyUnreached(SupportHost& host, const Disk& image, const std::string& name)
{
    const std::string why = host.imageAttachment().lastError(image.diskImagePath());
    return why.empty()
               ? host.translator().sentence(
                     "cannot check “%@”: there is no volume on it that can be checked", {name})
               : why;
}

}  // namespace orvane
