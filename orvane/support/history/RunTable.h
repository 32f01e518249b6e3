// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/history/Database.h"

#include <chrono>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace orvane {

/// How a run ended.
struct RunEnd {
    std::string verdict;  ///< one of the library's verdicts
    std::int32_t errorCode = 0;
    std::string message;            ///< one sentence; empty when there was nothing to say
    std::string tool = {};          ///< with its version; empty where none ran, or it is not known
    std::int64_t problems = 0;      ///< that were told of; 0 also where it is not known
    std::int64_t problemKinds = 0;  ///< of how many kinds they are; 0 likewise
    bool hasLosses = false;         ///< the result cost something; the message says what

    friend bool operator==(const RunEnd&, const RunEnd&) = default;
};

/// One action on one volume.
struct Run {
    using Time = std::chrono::system_clock::time_point;  ///< kept to the millisecond

    std::string action;
    Time started;
    /// Neither is known for a run that goes on, or was cut off with its program.
    std::optional<Time> finished;
    std::optional<RunEnd> end;
    bool isGoingOn = false;  ///< in this program or another

    /// The verdict, "running", or nothing when it was cut off.
    [[nodiscard]] std::string verdict() const;
};

/// The runs of every volume, oldest first. Part of the history store: main thread only.
class RunTable {
public:
    /// The database must outlive this object.
    explicit RunTable(Database& database);

    /// The run's number, for `end`; 0 when it could not be written.
    std::int64_t begin(std::int64_t volume, std::string_view action, Run::Time started);
    [[nodiscard]] bool end(std::int64_t run, const RunEnd& end, Run::Time finished);
    /// At most `limit` of the newest ones.
    [[nodiscard]] std::vector<Run> runs(std::int64_t volume, std::int64_t limit = 1000);

    /// Forgets all but the newest `count`; 0 forgets all.
    [[nodiscard]] bool keepNewest(std::int64_t volume, std::int64_t count);

private:
    Statement begin_;
    Statement open_;
    Statement close_;
    Statement end_;
    Statement list_;
    Statement trim_;
    Database& database_;
};

}  // namespace orvane
