// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/Failure.h"
#include "orvane/support/files/FileDescriptor.h"

#include <cstddef>
#include <filesystem>
#include <string>
#include <string_view>

namespace orvane {

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
    FileDescriptor descriptor_;
    std::string buffer_;
    bool hasWarned_ = false;
};

}  // namespace orvane
