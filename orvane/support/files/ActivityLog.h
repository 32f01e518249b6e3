// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/support/OVLog.h"
#include "orvane/support/files/Failure.h"
#include "pellar/process/FileDescriptor.h"

#include <cstddef>
#include <ctime>
#include <filesystem>
#include <string>
#include <string_view>

namespace orvane {

/// Adds `text` to `log`, line ends kept, with nothing in it that a terminal would obey when the
/// log is shown: other control characters and what is no UTF-8 become U+FFFD.
void appendLogText(std::string& log, std::string_view text);

/// The time of day as logs show it ("2024-05-06 07:08:09 "), local time. Costs little when asked
/// a million times in a second.
class LogClock {
public:
    [[nodiscard]] std::string_view now();

private:
    std::time_t second_ = -1;
    std::string text_;
};

/// A log file that is appended to through a buffer and never grows without bound: once it has
/// reached the limit it becomes NAME.1, what was NAME.1 becomes NAME.2, and so on; the oldest is
/// dropped. Two programs may write to one log, each in pieces of whole appends.
///
/// A log that cannot be written is said once through the warning sink, and what is appended is
/// then dropped; each flush tries again. One thread at a time.
class RotatingFile {
public:
    struct Limits {
        std::size_t bytes = 1U << 20U;  ///< a file may exceed it by one buffer
        int oldFiles = 3;
    };

    /// Makes no file yet. An empty path drops everything without a word.
    RotatingFile(std::filesystem::path file, Limits limits, WarningSink warn);
    RotatingFile(const RotatingFile&) = delete;
    RotatingFile& operator=(const RotatingFile&) = delete;
    ~RotatingFile();

    /// The buffer to append to; `flushWhenFull` afterwards.
    std::string& buffer() { return buffer_; }
    void flushWhenFull()
    {
        if (buffer_.size() >= bufferBytes)
            flush();
    }
    /// Hands what is buffered to the system, where it outlives this process.
    void flush();

private:
    static constexpr std::size_t bufferBytes = 64U << 10U;

    [[nodiscard]] int open();
    [[nodiscard]] int makeReady();
    [[nodiscard]] bool isStillTheFile() const;
    void rotate();
    std::filesystem::path oldFile(int number) const;

    std::filesystem::path file_;
    Limits limits_;
    WarningSink warn_;
    pellar::FileDescriptor descriptor_;
    std::string buffer_;
    bool hasWarned_ = false;
};

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
