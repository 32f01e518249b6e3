// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/RunLoop.h"

#include <string>

namespace contract {

/// Estimates how long a job still takes. A new estimator starts at the moment it is made.
class OVTimeEstimator {
public:
    virtual ~OVTimeEstimator() = default;

    /// Moves the reference point: at `start` the job stood at `percent` (0 to 100).
    virtual void setStartTimeWithPercentComplete(Threads::Date start, double percent) = 0;
    /// A short localized duration ("2 minutes"), or empty while there is no telling yet.
    virtual std::string timeEstimateString(double percent) = 0;
};

}  // namespace contract
