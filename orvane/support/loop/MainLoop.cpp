// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/loop/MainLoop.h"

#include "orvane/support/loop/EventLoop.h"

#include <unistd.h>

#include <poll.h>
#include <sys/eventfd.h>

#include <algorithm>
#include <cerrno>
#include <limits>
#include <system_error>
#include <tuple>
#include <utility>

namespace orvane {
namespace {

// Enough to make the system call between two turns cheap, few enough for Control-C to be heard.
constexpr int tasksInOneTurn = 512;

pellar::FileDescriptor makeWakeup()
{
    pellar::FileDescriptor wakeup(::eventfd(0, EFD_NONBLOCK | EFD_CLOEXEC));
    if (!wakeup)
        throw std::system_error(errno, std::generic_category(), "cannot make an event descriptor");
    return wakeup;
}

constexpr auto firesLater = [](const auto& a, const auto& b) {
    return std::tie(a.due, a.number) > std::tie(b.due, b.number);
};

}  // namespace

MainLoop::MainLoop() : wakeup_(makeWakeup()) {}

MainLoop::~MainLoop() = default;

bool MainLoop::isMainThread() const
{
    return std::this_thread::get_id() == mainThread_;
}

void MainLoop::post(Task task)
{
    bool mustWake = false;
    {
        const std::lock_guard guard(lock_);
        posted_.push_back(std::move(task));
        mustWake = !std::exchange(isWakeupPending_, true);
    }
    if (mustWake)
        wake();
}

void MainLoop::wake()
{
    const std::uint64_t one = 1;
    // The only failure, EAGAIN, means that the descriptor is readable already.
    [[maybe_unused]] const ssize_t written = ::write(wakeup_.get(), &one, sizeof one);
}

void MainLoop::scheduleTimer(std::chrono::duration<double> delay, Task task)
{
    const auto due = Clock::now() + std::chrono::duration_cast<Clock::duration>(delay);
    timers_.push_back({due, timersMade_++, std::move(task)});
    std::push_heap(timers_.begin(), timers_.end(), firesLater);
}

void MainLoop::watch(int descriptor, short events, WatchHandler handler)
{
    unwatch(descriptor);
    watches_.push_back(
        {descriptor, events, std::make_shared<const WatchHandler>(std::move(handler))});
}

void MainLoop::unwatch(int descriptor)
{
    std::erase_if(watches_, [=](const Watch& watch) { return watch.descriptor == descriptor; });
}

void MainLoop::run()
{
    runUntil([this] { return isStopped_.exchange(false); });
}

void MainLoop::stop()
{
    isStopped_ = true;
    wake();
}

void MainLoop::runUntil(const std::function<bool()>& isDone)
{
    while (!isDone()) {
        waitForWork();
        serveDescriptors();
        for (int count = 0; count < tasksInOneTurn && runNextTask(); ++count)
            if (isDone())
                return;
        // Timers that are set from here on wait for the next turn.
        const Clock::time_point now = Clock::now();
        while (runNextTimer(now))
            if (isDone())
                return;
    }
}

bool MainLoop::hasTasks()
{
    if (nextOfBatch_ < batch_.size())
        return true;
    const std::lock_guard guard(lock_);
    return !posted_.empty();
}

int MainLoop::pollTimeout()
{
    if (hasTasks())
        return 0;
    if (timers_.empty())
        return -1;
    const auto left =
        std::chrono::ceil<std::chrono::milliseconds>(timers_.front().due - Clock::now()).count();
    return static_cast<int>(std::clamp<std::int64_t>(left, 0, std::numeric_limits<int>::max()));
}

void MainLoop::waitForWork()
{
    pollfd wakeup{wakeup_.get(), POLLIN, 0};
    std::vector<pollfd> polled{wakeup};
    for (const Watch& watch : watches_)
        polled.push_back({watch.descriptor, watch.events, 0});
    ::poll(polled.data(), polled.size(), pollTimeout());
}

// Asked again without waiting, one descriptor at a time: a handler may have unwatched, closed and
// reopened any other one, and what poll reported for it before would then be about another file.
void MainLoop::serveDescriptors()
{
    std::uint64_t count = 0;
    [[maybe_unused]] const ssize_t taken = ::read(wakeup_.get(), &count, sizeof count);

    const std::vector<Watch> watched = watches_;
    for (const Watch& watch : watched) {
        const bool isStillWatched =
            std::any_of(watches_.begin(), watches_.end(),
                        [&](const Watch& other) { return other.handler == watch.handler; });
        pollfd polled{watch.descriptor, watch.events, 0};
        if (isStillWatched && ::poll(&polled, 1, 0) > 0)
            (*watch.handler)(polled.revents);
    }
}

bool MainLoop::runNextTask()
{
    if (nextOfBatch_ == batch_.size()) {
        batch_.clear();
        nextOfBatch_ = 0;
        const std::lock_guard guard(lock_);
        batch_.swap(posted_);
        isWakeupPending_ = false;
    }
    if (batch_.empty())
        return false;
    // Taken out first: the task may run a nested loop, which goes on behind it.
    const Task task = std::move(batch_[nextOfBatch_++]);
    task();
    return true;
}

bool MainLoop::runNextTimer(Clock::time_point now)
{
    if (timers_.empty() || timers_.front().due > now)
        return false;
    std::pop_heap(timers_.begin(), timers_.end(), firesLater);
    const Task task = std::move(timers_.back().task);
    timers_.pop_back();
    task();
    return true;
}

}  // namespace orvane
