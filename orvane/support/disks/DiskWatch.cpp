// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/disks/DiskWatch.h"

#include "orvane/support/disks/DiskEvents.h"

#include <fcntl.h>
#include <linux/netlink.h>
#include <poll.h>
#include <sys/socket.h>

#include <array>
#include <cerrno>
#include <system_error>
#include <utility>

namespace orvane {
namespace {

// The kernel's own messages, and those of udevd where it runs: its come when the device can be
// opened and its file system has been looked at. A library would choose one of the two.
constexpr unsigned kernelGroup = 1;
constexpr unsigned udevGroup = 2;

FileDescriptor openEvents()
{
    FileDescriptor events(
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
    Watcher(FileDescriptor events, int stop, std::function<void()> tell)
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

    const FileDescriptor events_;
    const int stop_;
    const std::function<void()> tell_;
    const FileDescriptor mountInfo_{::open("/proc/self/mountinfo", O_RDONLY | O_CLOEXEC)};
    std::vector<pellar::Mount> mounts_ = deviceMounts(pellar::currentMounts());
    EventBurst burst_;
};

DiskWatch::DiskWatch(HostLoop& loop, std::function<void()> changed)
    : loop_(loop), changed_(std::move(changed))
{
}

DiskWatch::~DiskWatch()
{
    *liveness_ = nullptr;
    stop_.press();
}

// The watcher is made here, not in its thread: it must not miss what follows.
Outcome<> DiskWatch::start()
{
    constexpr const char* attempt = "listen to the kernel for disks that come and go";
    FileDescriptor events = openEvents();
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
    return isListening ? Outcome<>(Done{}) : Outcome<>(cannot(attempt, "netlink", error));
}

}  // namespace orvane
