// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/jobs/JobOptions.h"

#include <cstddef>
#include <cstdint>

namespace orvane {

/// What a user keeps of repairs, so that they can be undone.
struct KeptAmount {
    std::size_t repairs = 0;
    std::size_t lastingRepairs = 0;  ///< of these, interrupted or in use: they are not deleted
    std::uint64_t bytes = 0;         ///< of what was overwritten

    friend bool operator==(const KeptAmount&, const KeptAmount&) = default;
};

/// In the user's own store (Trials::room), of disks and of permissions; nothing where there is no
/// store, and none is made. Any thread.
[[nodiscard]] KeptAmount keptAmount(const pellar::Trials& trials);

/// Deletes all that is kept there, but what is interrupted or in use. Answers what is left.
KeptAmount deleteKept(const pellar::Trials& trials);

}  // namespace orvane
