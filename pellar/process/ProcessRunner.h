// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/process/Command.h"
#include "pellar/process/ProcessOutput.h"
#include "pellar/process/Stopping.h"

#include <chrono>
#include <cstddef>
#include <string_view>

namespace pellar {

/// Who ended a run, where it did not end by itself.
enum class StopCause { None, User, TooMuchOutput, Silence };

struct RunResult {
    Ending ending;
    StopCause cause = StopCause::None;
};

/// Hears a run as it goes on. Every call comes from the thread that runs the tool.
class RunListener {
public:
    virtual void line(std::string_view line, bool isCut) = 0;
    /// From the descriptor progressDescriptorOfTool.
    virtual void progressLine(std::string_view line) = 0;
    /// The output limit of a repair is reached: it goes on, its lines are no longer told.
    virtual void lineLimitReached() = 0;
    /// The user wants it to end.
    virtual void stopAsked() {}
    /// There is nothing to read for the moment.
    virtual void pause() = 0;
    /// Between two pieces of output, now and then.
    virtual void tick() = 0;

protected:
    ~RunListener() = default;
};

struct RunRequest {
    Command command;
    Access access = Access::ReadOnly;
    int disk = -1;  ///< borrowed
    OutputLimits limits;
    std::chrono::milliseconds silenceLimit{0};  ///< none when 0
    GraceTimes graceTimes;
    /// The listener's `tick` comes at least so often; 0 for only when something happens.
    std::chrono::milliseconds longestTick{0};
    /// It holds its output back unless that is a terminal. A pipe where there are none.
    bool wantsTerminal = false;
    /// It would leave the disk half written if it were asked to end.
    bool ignoresStops = false;
};

/// A line longer than this is cut.
inline constexpr std::size_t longestToolLine = 65536;

/// Runs a tool to its end on the calling thread. However it is ended, it has been reaped, and
/// what it left in the pipes has been told, when this answers.
[[nodiscard]] RunResult runTool(const RunRequest& request, StopSwitch& stop, RunListener& listener);

}  // namespace pellar
