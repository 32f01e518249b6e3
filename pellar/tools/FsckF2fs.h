// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/tools/Tool.h"

namespace pellar {

/// Checks f2fs (fsck.f2fs(8), f2fs-tools 1.15).
class FsckF2fs final : public Tool {
public:
    std::string_view name() const override { return "fsck.f2fs"; }
    std::string_view package() const override { return "f2fs-tools"; }
    bool canRepair() const override { return true; }
    ToolHabits habits() const override { return {.logReplayedAs = "f2fs"}; }

    VolumeFacts examine(int disk, std::uint64_t offset,
                        std::uint64_t availableBytes) const override;
    std::vector<std::string> arguments(Access access, const std::string& disk,
                                       std::uint64_t offset) const override;
    std::unique_ptr<OutputReader> makeReader() const override;
    Judgement judge(const RunEvidence& evidence) const override;
};

}  // namespace pellar
