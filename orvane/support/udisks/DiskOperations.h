// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/loop/EventLoop.h"
#include "orvane/support/udisks/DiskRequest.h"
#include "orvane/support/udisks/Refusal.h"
#include "pellar/process/Command.h"

#include <cstdint>
#include <filesystem>
#include <functional>
#include <map>
#include <memory>
#include <stop_token>
#include <string>
#include <thread>
#include <vector>

namespace orvane {

/// Makes an image file a device of the system that stays until it is detached: through UDisks2, or
/// itself where there is none and this is root. Answers the device's node. IsReadOnly where the
/// file is to be written and this user may not; BeingUsed while a job of ours works on it, and
/// none can begin on it until then; Attached where it is. Not on the main thread: may take minutes.
[[nodiscard]] Result<std::string, Refusal> attachImage(const std::filesystem::path& image,
                                                       pellar::Access access,
                                                       const std::stop_token& stop = {});

/// Does all the steps of a request through UDisks2, or itself where there is none and this is
/// root. Not on the main thread: may take minutes. Abandoned when the thread is asked to stop.
[[nodiscard]] Result<void, Refusal> carryOut(const DiskRequest& request,
                                             const std::stop_token& stop = {});

/// Mounts, unmounts and ejects behind the main thread's back. Main thread.
class DiskOperations {
public:
    /// One sentence for each request that could not be done; none where the user changed his mind.
    using Finished = std::function<void(const std::vector<std::string>& failures)>;

    /// The loop outlives this object; `texts` too.
    DiskOperations(EventLoop& loop, const Translator& texts) : loop_(loop), texts_(texts) {}
    DiskOperations(const DiskOperations&) = delete;
    DiskOperations& operator=(const DiskOperations&) = delete;
    /// Does not wait for a password: what UDisks2 has been asked for, it goes on with alone. What
    /// this process does itself is brought to its end.
    ~DiskOperations();

    /// Does them one after another and tells from the loop. A disk that is being worked on, or
    /// that was named before, is left out.
    void start(std::vector<DiskRequest> requests, Finished finished);
    /// Something is being done to the disk with this identifier.
    [[nodiscard]] bool isUnderWay(const std::string& identifier) const;

private:
    struct Answer {
        DiskRequest request;
        Result<void, Refusal> answer;
    };
    struct Running {
        std::vector<std::string> identifiers;
        Finished finished;
        std::jthread thread;
    };
    using Number = std::uint64_t;

    static std::vector<Answer> carryOutAll(const std::vector<DiskRequest>& requests,
                                           const std::stop_token& stop);
    void finish(Number number, const std::vector<Answer>& answers);

    EventLoop& loop_;
    const Translator& texts_;
    Number latest_ = 0;
    /// Handed to the task that reports back, which finds it empty when this object has gone.
    std::shared_ptr<DiskOperations*> liveness_ = std::make_shared<DiskOperations*>(this);
    std::map<Number, Running> running_;
};

}  // namespace orvane
