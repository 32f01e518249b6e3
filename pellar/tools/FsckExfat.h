// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/tools/Tool.h"

namespace pellar {

/// Checks exFAT (fsck.exfat(8), exfatprogs 1.2.0).
class FsckExfat final : public Tool {
public:
    std::string_view name() const override { return "fsck.exfat"; }
    std::string_view package() const override { return "exfatprogs"; }
    bool canRepair() const override { return true; }

    VolumeFacts examine(int disk, std::uint64_t offset,
                        std::uint64_t availableBytes) const override;
    std::vector<std::string> arguments(Access access, const std::string& disk,
                                       std::uint64_t offset) const override;
    std::unique_ptr<OutputReader> makeReader() const override;
    Judgement judge(const RunEvidence& evidence) const override;
};

}  // namespace pellar
