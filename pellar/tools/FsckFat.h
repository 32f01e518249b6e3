// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/tools/Tool.h"

namespace pellar {

/// Checks FAT12, FAT16 and FAT32 (fsck.fat(8), dosfstools 4.2). A repair gathers its changes and
/// writes them at its end.
class FsckFat final : public Tool {
public:
    std::string_view name() const override { return "fsck.fat"; }
    std::string_view package() const override { return "dosfstools"; }
    bool canRepair() const override { return true; }

    VolumeFacts examine(int disk, std::uint64_t offset,
                        std::uint64_t availableBytes) const override;
    std::vector<std::string> arguments(Access access, const std::string& disk,
                                       std::uint64_t offset) const override;
    std::unique_ptr<OutputReader> makeReader() const override;
    Judgement judge(const RunEvidence& evidence) const override;
};

}  // namespace pellar
