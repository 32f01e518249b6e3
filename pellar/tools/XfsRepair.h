// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/tools/Tool.h"

namespace pellar {

/// Checks XFS (xfs_repair(8), xfsprogs 6.1).
class XfsRepair final : public Tool {
public:
    std::string_view name() const override { return "xfs_repair"; }
    std::string_view package() const override { return "xfsprogs"; }
    bool canRepair() const override { return true; }
    ToolHabits habits() const override { return {.logReplayedAs = "xfs"}; }

    VolumeFacts examine(int disk, std::uint64_t offset,
                        std::uint64_t availableBytes) const override;
    std::vector<std::string> arguments(Access access, const std::string& disk,
                                       std::uint64_t offset) const override;
    std::unique_ptr<OutputReader> makeReader() const override;
    Judgement judge(const RunEvidence& evidence) const override;
};

}  // namespace pellar
