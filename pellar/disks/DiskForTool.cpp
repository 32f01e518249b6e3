// SPDX-License-Identifier: Apache-2.0
#include "pellar/disks/DiskForTool.h"

namespace pellar {

std::variant<DiskForTool, int> DiskForTool::prepare(const DiskClaim& claim, Form form,
                                                    Access access)
{
    const bool isFit = form == Form::Itself || (form == Form::VolumeAlone && claim.isAllOfIt()) ||
                       (claim.isAllOfIt() && claim.isBlockDevice());
    DiskForTool disk(claim.descriptor(), isFit ? claim.offset() : 0);
    if (isFit)
        return std::variant<DiskForTool, int>(std::move(disk));
    auto loop =
        LoopDevice::attach(claim.descriptor(), claim.offset(), claim.availableBytes(), access);
    if (const int* const error = std::get_if<int>(&loop))
        return *error;
    disk.loop_.emplace(std::move(std::get<LoopDevice>(loop)));
    return std::variant<DiskForTool, int>(std::move(disk));
}

}  // namespace pellar
