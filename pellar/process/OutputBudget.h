// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/process/Access.h"

#include <cstdint>

namespace pellar {

/// How much one run of a tool may print.
struct OutputLimits {
    std::uint64_t lines = 1'000'000;
    std::uint64_t bytes = 256ULL << 20U;

    friend bool operator==(const OutputLimits&, const OutputLimits&) = default;
};

/// Counts what a run prints against its limits. A verification past a limit has told enough and
/// is ended; a repair is let run on, unheard, up to ten times the limit, because ending it in
/// the middle may leave the disk worse than it was.
class OutputBudget {
public:
    enum class State { Heard, Unheard, Spent };

    OutputBudget(OutputLimits limits, Access access) : limits_(limits), access_(access) {}

    void countBytes(std::uint64_t count) { bytes_ += count; }
    void countLine() { ++lines_; }

    State state() const
    {
        const bool isPast = lines_ > limits_.lines || bytes_ > limits_.bytes;
        const bool isFarPast = lines_ / 10 >= limits_.lines || bytes_ / 10 >= limits_.bytes;
        if (!isPast)
            return State::Heard;
        return access_ == Access::ReadWrite && !isFarPast ? State::Unheard : State::Spent;
    }

private:
    OutputLimits limits_;
    Access access_;
    std::uint64_t lines_ = 0;
    std::uint64_t bytes_ = 0;
};

}  // namespace pellar
