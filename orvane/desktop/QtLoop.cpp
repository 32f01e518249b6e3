// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/QtLoop.h"

#include "orvane/support/loop/EventLoop.h"

#include <QThread>

#include <memory>
#include <utility>

namespace orvane::desktop {
namespace {

using Clock = std::chrono::steady_clock;

// Short enough for sixty pictures a second: what came in is also saved before it is shown, which
// takes longer than taking it in.
constexpr std::chrono::milliseconds longestTurn{4};

}  // namespace

QtLoop::QtLoop()
{
    // Unlike a posted event, a timer waits until the window has had its turn.
    nextTurn_.setInterval(0);
    nextTurn_.setSingleShot(true);
    QObject::connect(&nextTurn_, &QTimer::timeout, &receiver_, [this] { runTurn(); });
}

bool QtLoop::isMainThread() const
{
    return QThread::currentThread() == receiver_.thread();
}

void QtLoop::scheduleTimer(std::chrono::duration<double> delay, Task task)
{
    const auto wait = std::chrono::ceil<std::chrono::milliseconds>(delay);
    QTimer::singleShot(wait, Qt::PreciseTimer, &receiver_, std::move(task));
}

// Woken while the lock is held: who has seen the task in the queue may end the loop.
void QtLoop::post(Task task)
{
    const std::lock_guard guard(lock_);
    tasks_.push_back(std::move(task));
    if (!std::exchange(isWakeupPending_, true))
        QMetaObject::invokeMethod(
            &receiver_, [this] { runTurn(); }, Qt::QueuedConnection);
}

void QtLoop::runTurn()
{
    // Set before the tasks run: one of them may open a dialog and return only when it is closed.
    nextTurn_.start();
    const Clock::time_point end = Clock::now() + longestTurn;
    while (runNextTask() && Clock::now() < end) {
    }
    if (mustGoOn())
        nextTurn_.start();
    else
        nextTurn_.stop();
}

bool QtLoop::runNextTask()
{
    Task task;
    {
        const std::lock_guard guard(lock_);
        if (tasks_.empty())
            return false;
        task = std::move(tasks_.front());
        tasks_.pop_front();
    }
    task();
    return true;
}

bool QtLoop::hasTasks()
{
    const std::lock_guard guard(lock_);
    return !tasks_.empty();
}

bool QtLoop::mustGoOn()
{
    const std::lock_guard guard(lock_);
    isWakeupPending_ = !tasks_.empty();
    return isWakeupPending_;
}

}  // namespace orvane::desktop
