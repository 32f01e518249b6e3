// SPDX-License-Identifier: Apache-2.0
#include "pellar/process/ProcessRunner.h"

#include "pellar/process/ChildProcess.h"
#include "pellar/process/FileDescriptor.h"
#include "pellar/process/ProcessOutput.h"

#include <poll.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <utility>

namespace pellar {
namespace {

using namespace std::chrono_literals;

/// How long a lull in the output must be before the listener is told of a pause.
constexpr auto lull = 20ms;

/// How long the progress is left in its pipe. A tool that tells it a thousand times a second is
/// held up each time it wakes its reader.
constexpr auto progressRest = 50ms;

/// One run, from the start of the child to its reaping.
class Run {
public:
    Run(const RunRequest& request, StopSwitch& stop, RunListener& listener, ChildProcess child,
        Pipe output, Pipe progress)
        : request_(request),
          stop_(stop),
          listener_(listener),
          child_(std::move(child)),
          output_(std::move(output)),
          progress_(std::move(progress)),
          budget_(request.limits, request.access),
          ladder_(request.graceTimes)
    {
        output_.writeEnd.reset();
        progress_.writeEnd.reset();
    }

    RunResult toItsEnd()
    {
        while (!hasEnded_)
            step();
        drain();
        const Ending ending = child_.reap();
        outputLines_.finish();
        progressLines_.finish();
        listener_.pause();
        return {ending, cause_};
    }

private:
    void step()
    {
        const bool isQuiet = waitForEvents();
        heedStopSwitch();
        send(ladder_.due(Clock::now()));
        if (isQuiet && isHeard_) {
            listener_.pause();
            isHeard_ = false;
        }
        if (request_.silenceLimit > 0ms && Clock::now() - lastHeard_ >= request_.silenceLimit)
            endFor(StopCause::Silence);
        listener_.tick();
    }

    /// YES when the time passed without any output.
    bool waitForEvents()
    {
        const bool isResting = progressRestLeft() > 0ms;
        std::array<pollfd, 4> events{{{output_.readEnd.get(), POLLIN, 0},
                                      {isResting ? -1 : progress_.readEnd.get(), POLLIN, 0},
                                      {child_.endDescriptor(), POLLIN, 0},
                                      {stop_.descriptor(), POLLIN, 0}}};
        if (::poll(events.data(), events.size(), timeout()) < 0)
            return false;  // interrupted
        hasEnded_ = events[2].revents != 0;
        const bool hasOutput = events[0].revents != 0;
        const bool hasProgress = events[1].revents != 0;
        if (hasOutput)
            read(output_.readEnd, outputLines_, true);
        if (hasProgress) {
            read(progress_.readEnd, progressLines_, false);
            progressDue_ = Clock::now() + progressRest;
        }
        return !hasOutput && !hasProgress;
    }

    /// Not more than 0 where the progress is waited for.
    std::chrono::milliseconds progressRestLeft() const
    {
        return std::chrono::ceil<std::chrono::milliseconds>(progressDue_ - Clock::now());
    }

    /// Milliseconds until something is due; -1 for never.
    int timeout() const
    {
        if (isHeard_)
            return static_cast<int>(lull.count());
        std::optional<Clock::time_point> due = ladder_.deadline();
        if (progress_.readEnd && progressRestLeft() > 0ms)
            due = std::min(due.value_or(Clock::time_point::max()), progressDue_);
        if (request_.silenceLimit > 0ms && !ladder_.isStopping())
            due = std::min(due.value_or(Clock::time_point::max()),
                           lastHeard_ + request_.silenceLimit);
        if (request_.longestTick > 0ms)
            due = std::min(due.value_or(Clock::time_point::max()),
                           Clock::now() + request_.longestTick);
        if (!due)
            return -1;
        const auto left = std::chrono::ceil<std::chrono::milliseconds>(*due - Clock::now());
        return static_cast<int>(std::clamp<std::int64_t>(left.count(), 0, 60'000));
    }

    /// The number of bytes; 0 when there is nothing more to be had for now.
    std::size_t read(FileDescriptor& descriptor, LineSplitter& lines, bool isOutput)
    {
        const ssize_t count = ::read(descriptor.get(), buffer_.data(), buffer_.size());
        // Every writer is gone, which a terminal says with EIO; poll(2) skips the empty place.
        if (count == 0 || (count < 0 && errno == EIO))
            descriptor.reset();
        if (count <= 0)
            return 0;
        isHeard_ = true;
        lastHeard_ = Clock::now();
        if (isOutput)
            budget_.countBytes(static_cast<std::uint64_t>(count));
        lines.take({buffer_.data(), static_cast<std::size_t>(count)});
        if (budget_.state() == OutputBudget::State::Spent)
            endFor(StopCause::TooMuchOutput);
        return static_cast<std::size_t>(count);
    }

    /// What the child left behind. A grandchild may still hold the pipes and print without end,
    /// so no more is read than a pipe can hold (1 MiB, pipe(7)).
    void drain()
    {
        drain(output_.readEnd, outputLines_, true);
        drain(progress_.readEnd, progressLines_, false);
    }

    void drain(FileDescriptor& descriptor, LineSplitter& lines, bool isOutput)
    {
        std::size_t left = 1U << 20U;
        while (descriptor && left > 0) {
            const std::size_t count = read(descriptor, lines, isOutput);
            if (count == 0)
                return;
            left -= std::min(left, count);
        }
    }

    void tellLine(std::string_view line, bool isCut)
    {
        budget_.countLine();
        if (budget_.state() == OutputBudget::State::Heard) {
            listener_.line(line, isCut);
        } else if (budget_.state() == OutputBudget::State::Unheard && !isLimitTold_) {
            isLimitTold_ = true;
            listener_.lineLimitReached();
        }
    }

    void heedStopSwitch()
    {
        if (!stop_.isPressed())
            return;
        stop_.rest();
        cause_ = StopCause::User;
        if (stop_.isHard())
            send(ladder_.pressHard(Clock::now()));
        if (!std::exchange(isStopTold_, true))
            listener_.stopAsked();
        for (; heededPresses_ < stop_.presses(); ++heededPresses_)
            send(ladder_.press(Clock::now()));
    }

    void endFor(StopCause cause)
    {
        if (ladder_.isStopping())
            return;
        cause_ = cause;
        // One that ignores being asked has no more time than when the program is leaving.
        send(request_.ignoresStops ? ladder_.pressHard(Clock::now()) : ladder_.press(Clock::now()));
    }

    void send(int signal)
    {
        if (signal != 0)
            child_.signalGroup(signal);
    }

    const RunRequest& request_;
    StopSwitch& stop_;
    RunListener& listener_;
    ChildProcess child_;
    Pipe output_;
    Pipe progress_;
    LineSplitter outputLines_{longestToolLine, [this](std::string_view line, bool isCut) {
                                  tellLine(line, isCut);
                              }};
    LineSplitter progressLines_{longestToolLine, [this](std::string_view line, bool isCut) {
                                    if (!isCut)
                                        listener_.progressLine(line);
                                }};
    OutputBudget budget_;
    StopLadder ladder_;
    StopCause cause_ = StopCause::None;
    unsigned heededPresses_ = 0;
    Clock::time_point lastHeard_ = Clock::now();
    Clock::time_point progressDue_ = Clock::now();
    bool isHeard_ = false;  ///< something was told since the last pause
    bool isLimitTold_ = false;
    bool isStopTold_ = false;
    bool hasEnded_ = false;
    std::array<char, 65536> buffer_;
};

std::optional<Pipe> makeOutput(const RunRequest& request)
{
    std::optional<Pipe> terminal;
    if (request.wantsTerminal)
        terminal = makePseudoTerminal();
    return terminal ? std::move(terminal) : makePipe();
}

}  // namespace

RunResult runTool(const RunRequest& request, StopSwitch& stop, RunListener& listener)
{
    if (stop.isPressed())
        return {NotStarted{ECANCELED}, StopCause::User};
    std::optional<Pipe> output = makeOutput(request);
    std::optional<Pipe> progress = makePipe();
    if (!output || !progress)
        return {NotStarted{errno}};
    auto started = ChildProcess::start(
        request.command, {output->writeEnd.get(), request.disk, progress->writeEnd.get(),
                          request.access, request.ignoresStops});
    if (!started)
        return {started.error()};
    Run run(request, stop, listener, *std::move(started), std::move(*output), std::move(*progress));
    return run.toItsEnd();
}

}  // namespace pellar
