// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/process/Stopping.h"

#include <optional>

namespace pellar {

/// Turns the progress of a job's runs into reports worth sending: strictly between 0 and 100,
/// never backwards, at most ten in a second, and only when there is a tenth of a per cent to
/// tell.
class ProgressMeter {
public:
    /// The share of the whole that the coming run takes, in per cent.
    void setRange(double from, double to);
    /// `percent` of the run; none when nothing is to be sent.
    std::optional<double> report(double percent, Clock::time_point now);

private:
    double from_ = 0;
    double to_ = 100;
    double last_ = 0;
    Clock::time_point lastTime_{};
};

}  // namespace pellar
