// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/loop/MainLoop.h"
#include "orvane/support/loop/Notifications.h"
#include "orvane/support/loop/WorkerThreads.h"

#include <gtest/gtest.h>
#include <poll.h>
#include <unistd.h>

#include <future>
#include <string>
#include <vector>

namespace orvane {
namespace {

using Wait = contract::RunLoop::Wait;
using namespace std::chrono_literals;

TEST(MainLoop, RunsWhatOtherThreadsHandOverInTheirOrder)
{
    constexpr int count = 20000;
    MainLoop loop;
    std::vector<int> seen;
    std::thread other([&] {
        for (int i = 0; i < count; ++i)
            loop.performOnMainThread([&seen, i] { seen.push_back(i); }, Wait::No);
        bool hasRun = false;
        loop.performOnMainThread([&] { hasRun = true; }, Wait::UntilDone);
        EXPECT_TRUE(hasRun) << "UntilDone returns after the task";
        loop.stop();
    });
    loop.run();
    other.join();
    ASSERT_EQ(seen.size(), std::size_t{count});
    EXPECT_TRUE(std::is_sorted(seen.begin(), seen.end()));
}

TEST(MainLoop, ANestedLoopGoesOnBehindTheTaskThatRunsIt)
{
    MainLoop loop;
    std::string order;
    loop.post([&] {
        order += "a(";
        bool isAnswered = false;
        loop.post([&] { isAnswered = true; });
        loop.runUntil([&] { return isAnswered; });
        order += ")";
    });
    loop.post([&] { order += "b"; });
    loop.post([&] { order += "c"; });
    loop.scheduleTimer(0s, [&] { loop.stop(); });
    loop.run();
    EXPECT_EQ(order, "a(bc)");
}

TEST(MainLoop, TimersFireInTheOrderOfTheirTimes)
{
    MainLoop loop;
    std::string order;
    loop.scheduleTimer(2ms, [&] { order += "2"; });
    loop.scheduleTimer(3ms, [&] { loop.stop(); });
    loop.scheduleTimer(1ms, [&] { order += "1"; });
    loop.scheduleTimer(2ms, [&] { order += "2'"; });
    loop.run();
    EXPECT_EQ(order, "122'");
}

TEST(MainLoop, NeitherTasksNorTimersStarveADescriptor)
{
    MainLoop loop;
    const auto pipe = pellar::makePipe().value();
    std::function<void()> forever = [&] {
        loop.post(forever);
    };
    std::function<void()> ticking = [&] {
        loop.scheduleTimer(0s, ticking);
    };
    forever();
    ticking();
    ASSERT_EQ(::write(pipe.writeEnd.get(), "x", 1), 1);
    loop.watch(pipe.readEnd.get(), POLLIN, [&](short) {
        loop.unwatch(pipe.readEnd.get());
        loop.stop();
    });
    loop.run();
}

// Gates decide who ends first; what arrives must not depend on it.
TEST(WorkerThreads, DeliverInTheOrderOfDetachingWhoeverEndsFirst)
{
    MainLoop loop;
    std::string order;
    std::promise<void> lastHasEnded;
    {
        WorkerThreads threads(loop);
        const auto gate = lastHasEnded.get_future().share();
        threads.detachNewThread([&, gate] {
            gate.wait();
            loop.performOnMainThread([&] { order += "a"; }, Wait::No);
        });
        threads.detachNewThread([&] {
            loop.performOnMainThread([&] { order += "b"; }, Wait::No);
            loop.performOnMainThread([&] { order += "B"; }, Wait::UntilDone);
        });
        threads.detachNewThread([&] {
            loop.performOnMainThread([&] { order += "c"; }, Wait::No);
            lastHasEnded.set_value();
        });
        loop.runUntil([&] { return order.size() == 4; });
    }
    EXPECT_EQ(order, "abBc");
}

TEST(WorkerThreads, ClosingWakesSleepersAndThoseWhoWaitForTheMainThread)
{
    MainLoop loop;
    bool hasRun = false;
    {
        WorkerThreads threads(loop);
        threads.setAttachesSynchronously(false);
        threads.detachNewThread([&] { threads.sleepUntil(threads.now() + 1h); });
        threads.detachNewThread(
            [&] { loop.performOnMainThread([&] { hasRun = true; }, Wait::UntilDone); });
    }
    loop.runUntil([] { return true; });
    EXPECT_FALSE(hasRun) << "what the task refers to may be gone";
}

TEST(Notifications, ChangesInTheMiddleOfADelivery)
{
    const contract::Name name("N");
    Notifications center;
    std::string heard;
    int a = 0, b = 0, c = 0;
    center.addObserver(&a, name, [&](const auto&) {
        heard += "a";
        center.removeObserver(&b, name);
        center.addObserver(&c, name, [&](const auto&) { heard += "c"; });
        center.removeObserver(&a, name);
    });
    center.addObserver(&b, name, [&](const auto&) { heard += "b"; });
    center.post({name, nullptr, {}});
    EXPECT_EQ(heard, "a") << "b was taken away before its turn, c came too late";
    center.post({name, nullptr, {}});
    EXPECT_EQ(heard, "ac");
}

}  // namespace
}  // namespace orvane
