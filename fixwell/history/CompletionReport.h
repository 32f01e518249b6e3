// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Array.h"
#include "contract/foundation/Dictionary.h"
#include "fixwell/Contract.h"

#include <optional>
#include <string>

namespace fixwell {

// What the host is told when a job has ended. Every name is its own text.

inline const Name kOVOP_ResultKey{"kOVOP_ResultKey"};
inline const Name kOVOP_SuccessKey{"kOVOP_SuccessKey"};
inline const Name kOVOP_FailKey{"kOVOP_FailKey"};
inline const Name kOVOP_DiskIdentifierKey{"kOVOP_DiskIdentifierKey"};
inline const Name kOVOP_DiskKey{"kOVOP_DiskKey"};
inline const Name kOVOP_ActionTypeKey{"kOVOP_ActionTypeKey"};
inline const Name kOVOP_RepairDiskKey{"kOVOP_RepairDiskKey"};
inline const Name kOVOP_RepairDiskPermissionsKey{"kOVOP_RepairDiskPermissionsKey"};
inline const Name kOVOP_VerifyDiskPermissionsKey{"kOVOP_VerifyDiskPermissionsKey"};
inline const Name kOVOP_VerifyDiskKey{"kOVOP_VerifyDiskKey"};

/// The report on a job that completed these entries. Only the first is reported, and "success"
/// says that there was one, not that its disk was sound.
Dictionary makeCompletionReport(const Array& completedList);

/// What the one alert at the end of a job says.
struct PostedWarning {
    std::string title;
    std::string message;

    friend bool operator==(const PostedWarning&, const PostedWarning&) = default;
};

/// The warning of the first completed entry that has one. Permission runs never warn. An entry
/// that carries an empty warning, where none carries a real one, gives an empty alert.
std::optional<PostedWarning> warningToPost(const Array& completedList);

}  // namespace fixwell
