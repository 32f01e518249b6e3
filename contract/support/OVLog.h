// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string_view>

namespace contract {

/// The host's two logs: the developers' log, by level, and the user's activity log. Main thread
/// only.
class OVLog {
public:
    // Levels of the developers' log.
    static constexpr int mismatch = 1;
    static constexpr int error = 2;
    static constexpr int trace = 3;

    virtual ~OVLog() = default;

    /// Whether a line of this level is kept; ask before putting a costly line together.
    virtual bool keepsLevel(int level) const = 0;
    /// One line for the developers. `flags` is always 0.
    virtual void ov_log(int level, int flags, std::string_view line) = 0;

    /// One entry of the user's activity log, in lines of its own.
    virtual void log(std::string_view text) = 0;
    /// Text that is part of an entry: with the host's priority, with or without an end of line
    /// added.
    virtual void logPriorityWithEOL(std::string_view text, int priority, bool addsEndOfLine) = 0;
};

}  // namespace contract
