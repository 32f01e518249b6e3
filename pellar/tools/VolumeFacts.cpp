// SPDX-License-Identifier: Apache-2.0
#include "pellar/tools/VolumeFacts.h"

#include "pellar/probe/DiskProbe.h"

namespace pellar {

bool isForeignTo(std::string_view filesystemType, bool isRecognized, int disk, std::uint64_t offset,
                 std::uint64_t availableBytes)
{
    if (!isRecognized)
        return true;
    const Superblock signature = readSuperblock(disk, {offset, availableBytes});
    return signature.isAmbivalent || (!signature.type.empty() && signature.type != filesystemType);
}

}  // namespace pellar
