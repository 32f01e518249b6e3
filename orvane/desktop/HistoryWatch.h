// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QFileSystemWatcher>
#include <QTimer>

#include <filesystem>
#include <functional>

namespace orvane::desktop {

/// Notices that the file of the histories is written to, by this program or another. Where the
/// system cannot watch, nothing is noticed. Main thread.
class HistoryWatch {
public:
    /// `changed` is called a moment after a change, once for those that follow each other closely.
    HistoryWatch(std::filesystem::path file, std::function<void()> changed);
    HistoryWatch(const HistoryWatch&) = delete;
    HistoryWatch& operator=(const HistoryWatch&) = delete;

    void start();

private:
    const std::filesystem::path file_;
    QFileSystemWatcher files_;
    QTimer moment_;
};

}  // namespace orvane::desktop
