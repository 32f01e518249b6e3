// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/HistoryWatch.h"

#include <QFile>

#include <chrono>
#include <string>
#include <utility>

namespace orvane::desktop {

HistoryWatch::HistoryWatch(std::filesystem::path file, std::function<void()> changed)
    : file_(std::move(file))
{
    moment_.setSingleShot(true);
    moment_.setInterval(std::chrono::milliseconds(300));
    QObject::connect(&moment_, &QTimer::timeout, &moment_, std::move(changed));
    QObject::connect(&files_, &QFileSystemWatcher::fileChanged, &moment_, [this] {
        if (!moment_.isActive())
            moment_.start();
    });
}

// SQLite writes to the log beside its file first (https://sqlite.org/wal.html), which is there as
// long as a program has the file open.
void HistoryWatch::start()
{
    const std::string log = file_.native() + "-wal";
    files_.addPaths({QFile::decodeName(file_.c_str()), QFile::decodeName(log.c_str())});
}

}  // namespace orvane::desktop
