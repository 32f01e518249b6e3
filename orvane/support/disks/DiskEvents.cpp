// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/disks/DiskEvents.h"

#include <sys/sysmacros.h>

#include <algorithm>

namespace orvane {
namespace {

using std::chrono::milliseconds;

constexpr milliseconds quietTime{200};
constexpr milliseconds longestWait{1000};

}  // namespace

// change@/devices/virtual/block/loop0 ACTION=change ... SUBSYSTEM=block MAJOR=7 ... (Linux 6.1),
// each field ended by a zero byte. udevd sends the same fields behind a header of its own.
bool isAboutBlockDevice(std::string_view message)
{
    using namespace std::string_view_literals;
    return message.find("\0SUBSYSTEM=block\0"sv) != std::string_view::npos;
}

std::vector<pellar::Mount> deviceMounts(const std::vector<pellar::Mount>& mounts)
{
    std::vector<pellar::Mount> kept;
    std::copy_if(mounts.begin(), mounts.end(), std::back_inserter(kept), [](const auto& mount) {
        return major(mount.device) != 0 || mount.source.starts_with("/dev/");
    });
    return kept;
}

void EventBurst::note(Clock::time_point now)
{
    events_ = Span{events_ ? events_->first : now, now};
}

std::optional<milliseconds> EventBurst::timeLeft(Clock::time_point now) const
{
    if (!events_)
        return std::nullopt;
    const auto due = std::min(events_->last + quietTime, events_->first + longestWait);
    return std::max(std::chrono::ceil<milliseconds>(due - now), milliseconds(0));
}

bool EventBurst::takeDue(Clock::time_point now)
{
    const auto left = timeLeft(now);
    if (!left || *left > milliseconds(0))
        return false;
    events_.reset();
    return true;
}

}  // namespace orvane
