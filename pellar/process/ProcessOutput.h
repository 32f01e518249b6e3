// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/process/Command.h"

#include <cstddef>
#include <cstdint>
#include <functional>
#include <string>
#include <string_view>

namespace pellar {

/// Cuts a stream of any bytes into lines. A line ends with "\n", "\r" or "\r\n"; the ends are not
/// part of it. It never keeps more than `longestLine` bytes: of a longer line the first part is
/// handed on at once, marked as cut, and the rest up to its end is dropped.
class LineSplitter {
public:
    /// The text is valid during the call only.
    using Receiver = std::function<void(std::string_view line, bool isCut)>;

    LineSplitter(std::size_t longestLine, Receiver receiver)
        : longestLine_(longestLine), receiver_(std::move(receiver))
    {
    }

    void take(std::string_view bytes);
    /// The stream has ended: what stands after the last line end is a line as well.
    void finish();

private:
    void append(std::string_view part);
    void endLine();

    std::size_t longestLine_;
    Receiver receiver_;
    std::string line_;
    bool isDropping_ = false;     ///< the rest of a line that was cut
    bool endedByReturn_ = false;  ///< a "\n" right here belongs to the "\r" before it
};

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
