// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/tools/Tool.h"

namespace pellar {

/// Checks NTFS (ntfsresize(8) and ntfsfix(8), ntfs-3g 2022.10.3). ntfsresize compares the records
/// of all files with the map of what is in use, and so finds out; ntfsfix mends the boot sector and
/// the copy of the first records, throws the journal away, and marks the volume to be checked by
/// its own system. Nothing here repairs more, so a repair never ends with "repaired".
class Ntfs final : public Tool {
public:
    std::string_view name() const override { return "ntfsresize"; }
    std::string_view repairName() const override { return "ntfsfix"; }
    std::string_view package() const override { return "ntfs-3g"; }
    bool canRepair() const override { return true; }

    VolumeFacts examine(int disk, std::uint64_t offset,
                        std::uint64_t availableBytes) const override;
    std::vector<std::string> arguments(Access access, const std::string& disk,
                                       std::uint64_t offset) const override;
    std::unique_ptr<OutputReader> makeReader() const override;
    Judgement judge(const RunEvidence& evidence) const override;
};

}  // namespace pellar
