// SPDX-License-Identifier: Apache-2.0
#include "pellar/jobs/ProgressMeter.h"

#include <algorithm>

namespace pellar {

using namespace std::chrono_literals;

void ProgressMeter::setRange(double from, double to)
{
    from_ = from;
    to_ = to;
}

std::optional<double> ProgressMeter::report(double percent, Clock::time_point now)
{
    double whole = std::clamp(from_ + (to_ - from_) * percent / 100, 0.1, 99.9);
    // To the module a first report of exactly 20 says that a permissions database is being read.
    if (static_cast<float>(whole) == 20.0F)
        whole = 20.05;
    if (whole - last_ < 0.1 || now - lastTime_ < 100ms)
        return std::nullopt;
    last_ = whole;
    lastTime_ = now;
    return whole;
}

}  // namespace pellar
