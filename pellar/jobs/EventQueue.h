// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Dictionary.h"
#include "contract/foundation/RunLoop.h"
#include "contract/pellar/ErrorCodes.h"
#include "contract/pellar/PLRepairDisk.h"
#include "pellar/process/Stopping.h"

#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

namespace pellar {

class JobObserver;

struct Started {};

/// A plain line when there is no dictionary.
struct Message {
    std::string text;
    contract::Dictionary dictionary;
};

/// For the developers: a command before it runs, why a tool was chosen or refused.
struct Trace {
    std::string line;
};

struct Finished {
    contract::ErrorCode mainError = contract::kPLNoError;
    std::int32_t detailError = 0;
    contract::Dictionary result;
};

/// What a job tells, in the order in which it happened.
using Event = std::variant<Started, Message, Trace, Finished>;

/// Where a job's events arrive, on the main thread.
struct EventReceiver {
    contract::PLAsyncDelegate* delegate = nullptr;  ///< not owned
    contract::DiskReferencePointer disk;
    std::function<void(std::string_view)> trace;  ///< may be empty
    /// The job is over; called just before the delegate hears so, so that the delegate may begin
    /// the next one. It may destroy the queue.
    std::function<void()> ended;
    JobObserver* observer = nullptr;  ///< hears of the end just before the delegate; or null
};

/// Carries events from a job's thread to the main thread. They travel in batches, and only a few
/// batches at a time: when the main thread is slow, `add` waits, the job stops reading, and the
/// tool waits on its pipe. So memory stays bounded whatever a tool prints.
class EventQueue {
public:
    static constexpr std::size_t batchEvents = 2048;
    static constexpr std::size_t batchBytes = 256U << 10U;
    static constexpr int batchesUnderWay = 4;

    EventQueue(contract::RunLoop& loop, EventReceiver receiver);

    // The job's thread.

    void add(Event event);
    /// Sends what has been added.
    void flush();
    /// The same when the oldest of it has waited for a tenth of a second.
    void flushIfDue();

    // Main thread.

    /// Nothing arrives any more, also not what is already under way, and `add` waits no longer.
    void close();

private:
    struct Shared;
    class Batch;

    static void tellProgress(const EventReceiver& to, const contract::Dictionary& message);
    static void deliver(Shared& shared, std::vector<Event>& events);

    contract::RunLoop& loop_;
    std::shared_ptr<Shared> shared_;
    std::vector<Event> batch_;
    std::size_t bytes_ = 0;
    Clock::time_point oldest_;
};

}  // namespace pellar
