// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/support/OVLog.h"
#include "orvane/support/log/LogText.h"
#include "orvane/support/log/RotatingFile.h"

namespace orvane {

/// The host's two logs as files: the developers' `fixwell.log`, written line by line, and the
/// user's `activity.log`, which is buffered because a checking tool can say a million lines.
/// Main thread only.
class ActivityLog final : public contract::OVLog {
public:
    struct Options {
        std::filesystem::path directory;  ///< empty: nothing is kept
        int keptLevel = error;            ///< developers' lines up to this level are kept
        int shownLevel = 0;               ///< and up to this one go to standard error, too
        RotatingFile::Limits limits = {};
    };

    ActivityLog(const Options& options, const WarningSink& warn);

    bool keepsLevel(int level) const override;
    void ov_log(int level, int flags, std::string_view line) override;
    void log(std::string_view text) override;
    void logPriorityWithEOL(std::string_view text, int priority, bool addsEndOfLine) override;

    /// Hands the buffered activity to the system: when a job ends, and before a question that the
    /// user may leave the program at.
    void flush();

private:
    int keptLevel_;
    int shownLevel_;
    LogClock clock_;
    RotatingFile developers_;
    RotatingFile activity_;
    bool isAtLineStart_ = true;
};

}  // namespace orvane
