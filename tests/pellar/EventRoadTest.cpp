// SPDX-License-Identifier: Apache-2.0
#include "pellar/jobs/EventRoad.h"

#include "tests/pellar/Workshop.h"

#include <gtest/gtest.h>

#include <atomic>

namespace {

using namespace pellar;

TEST(EventRoad, HoldsAFloodBackAndLosesNothing)
{
    constexpr std::size_t events = 50'000;
    test::TestLoop loop;
    test::Listener listener;
    EventRoad road(loop, {&listener, {}, {}, [] {
                          }});
    std::atomic<std::size_t> added = 0;
    std::jthread job([&] {
        for (; added < events; ++added)
            road.add(Message{std::to_string(added), {}});
        road.add(Finished{});
        road.flush();
    });
    while (loop.waiting() < EventRoad::batchesUnderWay)
        std::this_thread::yield();
    EXPECT_LE(added, (EventRoad::batchesUnderWay + 1) * EventRoad::batchEvents);
    ASSERT_TRUE(loop.runUntil([&] { return listener.finished == 1; }));
    ASSERT_EQ(listener.plainLines.size(), events);
    for (std::size_t i = 0; i < events; ++i)
        ASSERT_EQ(listener.plainLines[i], std::to_string(i));
}

TEST(EventRoad, TellsNothingOnceItIsClosed)
{
    test::TestLoop loop;
    test::Listener listener;
    EventRoad road(loop, {&listener, {}, {}, [] {
                          }});
    std::jthread job([&] {
        for (int i = 0; i < 100'000; ++i)  // would wait for room that nobody makes
            road.add(Message{"x", {}});
    });
    while (loop.waiting() < EventRoad::batchesUnderWay)
        std::this_thread::yield();
    road.close();
    job.join();
    loop.drain();
    EXPECT_TRUE(listener.plainLines.empty());
}

TEST(EventRoad, StopsInTheMiddleOfABatch)
{
    test::TestLoop loop;
    test::Listener listener;
    EventRoad road(loop, {&listener, {}, {}, [] {
                          }});
    listener.onMessage = [&road] {
        road.close();
    };
    road.add(Message{"first", {}});
    road.add(Message{"second", {}});
    road.flush();
    loop.drain();
    EXPECT_EQ(listener.plainLines, std::vector<std::string>{"first"});
}

}  // namespace
