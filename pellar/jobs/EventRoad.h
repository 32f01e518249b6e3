// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/RunLoop.h"
#include "contract/pellar/PLRepairDisk.h"
#include "pellar/jobs/Event.h"
#include "pellar/process/Stopping.h"

#include <cstddef>
#include <functional>
#include <memory>
#include <string_view>
#include <vector>

namespace pellar {

/// Where a job's events arrive, on the main thread.
struct EventReceiver {
    contract::PLAsyncDelegate* delegate = nullptr;  ///< not owned
    contract::DiskReferencePointer disk;
    std::function<void(std::string_view)> trace;  ///< may be empty
    /// The job is over; called just before the delegate hears so, so that the delegate may begin
    /// the next one. It may destroy the road.
    std::function<void()> ended;
};

/// The road from a job's thread to the main thread. Events travel in batches, and only a few
/// batches at a time: when the main thread is slow, `add` waits, the job stops reading, and the
/// tool waits on its pipe. So memory stays bounded whatever a tool prints.
class EventRoad {
public:
    static constexpr std::size_t batchEvents = 2048;
    static constexpr std::size_t batchBytes = 256U << 10U;
    static constexpr int batchesUnderWay = 4;

    EventRoad(contract::RunLoop& loop, EventReceiver receiver);

    // The job's thread.

    void add(Event event);
    /// Sends what has been added.
    void flush();
    /// The same when the oldest of it has waited for a tenth of a second.
    void flushIfDue();

    // Main thread.

    /// Nothing arrives any more, also not what is already under way, and nobody waits.
    void close();

private:
    struct Shared;
    class Crossing;

    static void deliver(Shared& shared, std::vector<Event>& events);

    contract::RunLoop& loop_;
    std::shared_ptr<Shared> shared_;
    std::vector<Event> batch_;
    std::size_t bytes_ = 0;
    Clock::time_point oldest_;
};

}  // namespace pellar
