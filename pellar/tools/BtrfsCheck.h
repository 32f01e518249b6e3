// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/tools/Tool.h"

namespace pellar {

/// Checks btrfs (btrfs-check(8), btrfs-progs 6.2). It never repairs: by its own manual that is
/// dangerous, and not to be done without a developer's advice.
class BtrfsCheck final : public Tool {
public:
    std::string_view name() const override { return "btrfs"; }
    std::string_view package() const override { return "btrfs-progs"; }
    bool canRepair() const override { return false; }
    Sentence reasonAgainstRepair() const override;

    VolumeFacts examine(int disk, std::uint64_t offset,
                        std::uint64_t availableBytes) const override;
    std::vector<std::string> arguments(Access access, const std::string& disk,
                                       std::uint64_t offset) const override;
    std::unique_ptr<OutputReader> makeReader() const override;
    Judgement judge(const RunEvidence& evidence) const override;
};

}  // namespace pellar
