// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/pellar/ErrorCodes.h"
#include "pellar/outcome/Task.h"
#include "pellar/texts/Sentence.h"

#include <filesystem>
#include <string_view>

namespace pellar {

/// Whether there is an installed tool that can do something with a kind of file system.
struct Capability {
    contract::ErrorCode error = contract::kPLNoError;
    Sentence reason;                ///< why not; empty when it is given
    std::filesystem::path program;  ///< what would run

    bool isGiven() const { return error == contract::kPLNoError; }
};

/// `filesystemType` as libblkid names it; `toolPath` is searched for the tool.
Capability capabilityFor(std::string_view filesystemType, Operation operation,
                         std::string_view toolPath, RepairWay way = RepairWay::Direct);

/// Whether a volume of this kind, as libblkid names it, can be verified while it stays mounted and
/// is written to: with an answer that is true, by a tool that is there. It needs root.
[[nodiscard]] Capability liveCapabilityFor(std::string_view filesystemType,
                                           std::string_view toolPath);

}  // namespace pellar
