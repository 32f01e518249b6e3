// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
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

}  // namespace pellar
