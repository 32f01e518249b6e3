// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/disks/DiskWatch.h"

#include <fcntl.h>
#include <linux/netlink.h>
#include <poll.h>
#include <sys/socket.h>
#include <sys/sysmacros.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <system_error>
#include <utility>

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

namespace {

// The kernel's own messages, and those of udevd where it runs: its come when the device can be
// opened and its file system has been looked at. A library would choose one of the two.
constexpr unsigned kernelGroup = 1;
constexpr unsigned udevGroup = 2;

pellar::FileDescriptor openEvents()
{
    pellar::FileDescriptor events(
        ::socket(AF_NETLINK, SOCK_RAW | SOCK_CLOEXEC | SOCK_NONBLOCK, NETLINK_KOBJECT_UEVENT));
    sockaddr_nl address{};
    address.nl_family = AF_NETLINK;
    address.nl_groups = kernelGroup | udevGroup;
    if (events &&
        ::bind(events.get(), reinterpret_cast<const sockaddr*>(&address), sizeof address) != 0)
        return {};
    return events;
}

/// Takes all messages that wait; YES when one is about a disk. Who sent them is not asked: all
/// that a message can do is to have the disks read.
bool takeDiskEvents(int events)
{
    bool areAboutDisks = false;
    std::array<char, 8192> buffer{};
    while (true) {
        const ssize_t length = ::recv(events, buffer.data(), buffer.size(), MSG_DONTWAIT);
        if (length >= 0)
            areAboutDisks |= isAboutBlockDevice({buffer.data(), static_cast<std::size_t>(length)});
        else if (errno == ENOBUFS)
            areAboutDisks = true;  // messages were lost, so it is not known
        else if (errno != EINTR)
            return areAboutDisks;
    }
}

}  // namespace

/// The thread's own part: waits, joins events, and has them told.
class DiskWatch::Watcher {
public:
    Watcher(pellar::FileDescriptor events, int stop, std::function<void()> tell)
        : events_(std::move(events)), stop_(stop), tell_(std::move(tell))
    {
    }

    void run()
    {
        std::array<pollfd, 3> polled{pollfd{stop_, POLLIN, 0}, pollfd{events_.get(), POLLIN, 0},
                                     pollfd{mountInfo_.get(), POLLPRI, 0}};
        while (true) {
            const auto left = burst_.timeLeft(EventBurst::Clock::now());
            const int count =
                ::poll(polled.data(), polled.size(), left ? static_cast<int>(left->count()) : -1);
            if (count > 0 && polled[0].revents != 0)
                return;
            if (count > 0)
                take(polled[1], polled[2]);
            if (burst_.takeDue(EventBurst::Clock::now()))
                tell_();
        }
    }

private:
    // The mount table is readable at all times; a change is urgent (proc(5), mountinfo).
    void take(pollfd& events, pollfd& mountInfo)
    {
        bool hasChanged = false;
        if ((events.revents & POLLNVAL) == 0 && events.revents != 0)
            hasChanged = takeDiskEvents(events.fd);
        if ((mountInfo.revents & POLLPRI) != 0)
            hasChanged |= mountsHaveChanged();
        if (hasChanged)
            burst_.note(EventBurst::Clock::now());
    }

    bool mountsHaveChanged()
    {
        auto now = deviceMounts(pellar::currentMounts());
        return std::exchange(mounts_, now) != now;
    }

    const pellar::FileDescriptor events_;
    const int stop_;
    const std::function<void()> tell_;
    const pellar::FileDescriptor mountInfo_{::open("/proc/self/mountinfo", O_RDONLY | O_CLOEXEC)};
    std::vector<pellar::Mount> mounts_ = deviceMounts(pellar::currentMounts());
    EventBurst burst_;
};

DiskWatch::DiskWatch(EventLoop& loop, std::function<void()> changed)
    : loop_(loop), changed_(std::move(changed))
{
}

DiskWatch::~DiskWatch()
{
    *liveness_ = nullptr;
    stop_.press();
}

// The watcher is made here, not in its thread: it must not miss what follows.
Result<void, Failure> DiskWatch::start()
{
    constexpr const char* attempt = "listen to the kernel for disks that come and go";
    pellar::FileDescriptor events = openEvents();
    const int error = errno;
    const bool isListening = static_cast<bool>(events);
    auto watcher = std::make_shared<Watcher>(std::move(events), stop_.descriptor(),
                                             [&loop = loop_, watch = liveness_] {
                                                 loop.post([watch] {
                                                     if (*watch != nullptr)
                                                         (*watch)->changed_();
                                                 });
                                             });
    try {
        thread_ = std::jthread([watcher] { watcher->run(); });
    } catch (const std::system_error& refused) {
        return cannot(attempt, "netlink", refused.code().value());
    }
    if (!isListening)
        return cannot(attempt, "netlink", error);
    return {};
}

}  // namespace orvane
