// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/ScheduledChecks.h"

#include <QFile>

#include <chrono>
#include <system_error>
#include <utility>

namespace orvane::desktop {

ScheduledChecks::ScheduledChecks(EventLoop& loop, std::function<void()> changed,
                                 std::filesystem::path directory)
    : loop_(loop), changed_(std::move(changed)), directory_(std::move(directory))
{
    moment_.setSingleShot(true);
    moment_.setInterval(std::chrono::milliseconds(300));
    QObject::connect(&moment_, &QTimer::timeout, &moment_, [this] { look(); });
    QObject::connect(&files_, &QFileSystemWatcher::directoryChanged, &moment_,
                     [this] { moment_.start(); });
    clock_.setInterval(std::chrono::minutes(10));
    QObject::connect(&clock_, &QTimer::timeout, &clock_, [this] { look(); });
}

void ScheduledChecks::start()
{
    clock_.start();
    look();
}

// A check that has ended has another next time. The directory is made with the first check.
void ScheduledChecks::look()
{
    if (files_.directories().isEmpty())
        files_.addPath(QFile::decodeName(directory_.c_str()));
    auto published = readPublishedChecks(directory_);
    if (published != std::exchange(published_, published))
        changed_();
    askForTimers();
}

void ScheduledChecks::askForTimers()
{
    const auto ask = [&loop = loop_, asked = liveness_](const std::stop_token& stop) {
        loop.post([asked, timers = readCheckTimers(stop)] {
            if (ScheduledChecks* const checks = *asked;
                checks != nullptr && std::exchange(checks->timers_, timers) != timers)
                checks->changed_();
        });
    };
    try {
        thread_ = std::jthread(ask);
    } catch (const std::system_error&) {
        // Where the system gives no thread, nothing is said of the next check.
    }
}

}  // namespace orvane::desktop
