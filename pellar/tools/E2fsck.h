// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/tools/Tool.h"

namespace pellar {

/// Checks ext2, ext3 and ext4 (e2fsck(8), e2fsprogs 1.47).
class E2fsck final : public Tool {
public:
    std::string_view name() const override { return "e2fsck"; }
    std::string_view package() const override { return "e2fsprogs"; }
    bool canRepair() const override { return true; }
    ToolHabits habits() const override
    {
        return {.takesOffset = true,
                .wantsTerminal = false,
                .isLookedAtBeforeRepair = false,
                .endsInOrder = true,
                .logReplayedAs = {}};
    }

    VolumeFacts examine(int disk, std::uint64_t offset,
                        std::uint64_t availableBytes) const override;
    std::vector<std::string> arguments(Access access, const std::string& disk,
                                       std::uint64_t offset) const override;
    std::unique_ptr<OutputReader> makeReader() const override;
    std::optional<double> percentOf(std::string_view progressLine) const override;
    Judgement judge(const RunEvidence& evidence) const override;
};

}  // namespace pellar
