// SPDX-License-Identifier: Apache-2.0
#include "orvane/privileges/PrivilegedScript.h"

#include "fixwell/host/pellar/ErrorCodes.h"
#include "fixwell/host/pellar/MessageKeys.h"
#include "orvane/privileges/EventWire.h"
#include "orvane/privileges/HelperProcess.h"

#include <poll.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <utility>

namespace orvane {

using pellar::Sentence;

PrivilegedScript::PrivilegedScript(std::vector<std::string> launcher, HelperRequest request,
                                   const pellar::Texts& texts, pellar::StopSwitch& stop,
                                   pellar::EventRoad& road)
    : launcher_(std::move(launcher)),
      request_(std::move(request)),
      texts_(texts),
      stop_(stop),
      road_(road),
      log_(request_.disk, texts, road)
{
}

void PrivilegedScript::run()
{
    std::vector<std::string> command = launcher_;
    for (const std::string& argument : argumentsOf(request_))
        command.push_back(argument);
    std::optional<int> status;
    if (auto helper = HelperProcess::start(command)) {
        follow(*helper);
        helper->closeInput();
        status = helper->reap();
    }
    if (!hasStarted_)
        log_.started();
    if (!hasFinished_)
        explain(status);
    road_.flush();
}

void PrivilegedScript::follow(HelperProcess& helper)
{
    std::array<pollfd, 2> polled{pollfd{helper.output(), POLLIN, 0},
                                 pollfd{stop_.descriptor(), POLLIN, 0}};
    std::array<char, 16384> buffer;
    while (true) {
        constexpr int lookAgain = 100;  // milliseconds, for what waits on the road
        if (::poll(polled.data(), polled.size(), lookAgain) < 0 && errno != EINTR)
            return;
        if (polled[1].revents != 0)
            passStopOn(helper);
        if (polled[0].revents == 0) {
            road_.flush();
            continue;
        }
        const ssize_t count = ::read(helper.output(), buffer.data(), buffer.size());
        if (count > 0)
            take({buffer.data(), static_cast<std::size_t>(count)});
        else if (count == 0 || errno != EINTR)
            return;
    }
}

void PrivilegedScript::take(std::string_view lines)
{
    for (const char character : lines) {
        if (character != '\n') {
            unfinishedLine_ += character;
            continue;
        }
        if (auto event = eventFromLine(unfinishedLine_)) {
            hasStarted_ = true;
            hasFinished_ = hasFinished_ || std::holds_alternative<pellar::Finished>(*event);
            road_.add(std::move(*event));
        }
        unfinishedLine_.clear();
    }
}

void PrivilegedScript::passStopOn(HelperProcess& helper)
{
    stop_.rest();
    for (; pressesTold_ < stop_.presses(); ++pressesTold_)
        helper.tell("stop");
    if (stop_.isHard())
        helper.closeInput();
}

// What pkexec answers for itself is told by pkexec(1), "RETURN VALUE".
void PrivilegedScript::explain(std::optional<int> status)
{
    constexpr int dismissed = 126;
    constexpr int notAuthorized = 127;
    if (status == dismissed)
        finish(fixwell::kPLErrorCancelled, fixwell::kPLVerdictStopped,
               {"the authorisation was not given; nothing was done", {}, {}});
    else if (status == notAuthorized && !hasStarted_)
        finish(fixwell::kPLErrorCannotOpen, fixwell::kPLVerdictFailed,
               {"you are not authorised to work on this disk; nothing was done", {}, {}});
    else if (!hasStarted_)
        finish(fixwell::kPLErrorCannotOpen, fixwell::kPLVerdictFailed,
               {"it needs an administrator's rights, and they could not be asked for", {}, {}});
    else
        finish(fixwell::kPLErrorToolFailed, fixwell::kPLVerdictFailed,
               {"the program that works on it as administrator ended unexpectedly", {}, {}});
}

void PrivilegedScript::finish(fixwell::ErrorCode error, fixwell::Name verdict, Sentence reason)
{
    const std::string_view key = request_.operation == pellar::Operation::Repair
                                     ? "cannot repair “%1$@”: %2$@"
                                     : "cannot verify “%1$@”: %2$@";
    const std::string message = Sentence{key, log_.diskName(), reason.in(texts_)}.in(texts_);
    log_.failure(message);
    log_.finished(error, 0, verdict, message);
}

}  // namespace orvane
