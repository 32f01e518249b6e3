// SPDX-License-Identifier: Apache-2.0
#include "orvane/privileges/PrivilegedScript.h"

#include "contract/pellar/ErrorCodes.h"
#include "contract/pellar/MessageKeys.h"
#include "orvane/privileges/EventWire.h"
#include "orvane/privileges/HelperProcess.h"
#include "pellar/process/Command.h"

#include <poll.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <utility>

namespace orvane {

PrivilegedScript::PrivilegedScript(HelperLaunch launch, pellar::PrivilegedJob job,
                                   const pellar::Texts& texts, pellar::StopSwitch& stop,
                                   pellar::EventQueue& events)
    : launch_(std::move(launch)),
      job_(std::move(job)),
      request_(requestFor(job_, launch_.languages)),
      texts_(texts),
      stop_(stop),
      events_(events),
      log_(job_.disk, texts, events),
      guard_(texts)
{
}

void PrivilegedScript::run()
{
    std::vector<std::string> command = launch_.launcher;
    for (const std::string& argument : argumentsOf(request_))
        command.push_back(argument);
    log_.trace("run: " + pellar::shown({command.front(), {command.begin() + 1, command.end()}}));
    events_.flush();
    isAsking_ = true;
    if (launch_.asking.begins)
        launch_.asking.begins();
    std::optional<int> status;
    if (auto helper = HelperProcess::start(command)) {
        follow(*helper);
        helper->closeInput();
        status = helper->reap();
    }
    asked();
    if (!hasStarted_)
        log_.started();
    if (!hasFinished_)
        explain(status);
    events_.flush();
}

void PrivilegedScript::follow(HelperProcess& helper)
{
    std::array<pollfd, 2> polled{pollfd{helper.output(), POLLIN, 0},
                                 pollfd{stop_.descriptor(), POLLIN, 0}};
    std::array<char, 16384> buffer;
    while (true) {
        constexpr int lookAgain = 100;  // milliseconds, for what waits on the events
        if (::poll(polled.data(), polled.size(), lookAgain) < 0 && errno != EINTR)
            return;
        if (polled[1].revents != 0)
            passStopOn(helper);
        if (polled[0].revents == 0) {
            events_.flush();
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
        if (auto event = eventFromLine(unfinishedLine_))
            take(std::move(*event));
        unfinishedLine_.clear();
    }
}

// Nothing is told after the end, whatever comes. A result on an image waits for the end, when the
// image is looked at.
void PrivilegedScript::take(pellar::Event event)
{
    if (hasFinished_)
        return;
    asked();
    hasStarted_ = true;
    if (auto* const end = std::get_if<pellar::Finished>(&event))
        takeEnd(std::move(*end));
    else if (!held_.empty() || (job_.image && isResult(event)))
        held_.push_back(std::move(event));
    else
        events_.add(std::move(event));
}

// What was found in a device on an image is true of nothing when the image was cut off or replaced
// in the meantime, which the device does not show.
void PrivilegedScript::takeEnd(pellar::Finished end)
{
    hasFinished_ = true;
    const bool isAnswer = job_.image && end.mainError != contract::kPLErrorCancelled;
    if (isAnswer && !job_.image->isStillWhole())
        return finish(contract::kPLErrorDiskChanged, contract::kPLVerdictFailed,
                      "the disk became shorter or unreadable meanwhile");
    if (isAnswer && !job_.image->isStillInPlace())
        return finish(contract::kPLErrorDiskChanged, contract::kPLVerdictFailed,
                      "the disk was deleted, moved or replaced meanwhile");
    for (pellar::Event& event : held_)
        events_.add(std::move(event));
    events_.add(std::move(end));
}

/// A line by which the module knows that the disk is in order, or that it is not.
bool PrivilegedScript::isResult(const pellar::Event& event) const
{
    const auto* const message = std::get_if<pellar::Message>(&event);
    if (message == nullptr)
        return false;
    if (message->dictionary)
        return message->dictionary.string(contract::kFsckMessageType) ==
               contract::kFsckSuccess.text();
    const auto meaning = guard_.meaningOf(message->text);
    return meaning == contract::LinePhrase::Success || meaning == contract::LinePhrase::Failure;
}

void PrivilegedScript::passStopOn(HelperProcess& helper)
{
    stop_.rest();
    for (; pressesTold_ < stop_.presses(); ++pressesTold_)
        helper.tell("stop");
    if (stop_.isHard())
        helper.closeInput();
}

void PrivilegedScript::asked()
{
    if (std::exchange(isAsking_, false) && launch_.asking.ends)
        launch_.asking.ends();
}

// A Ctrl-C at the prompt ends pkexec. What it answers for itself is told by pkexec(1), "RETURN
// VALUE".
void PrivilegedScript::explain(std::optional<int> status)
{
    constexpr int dismissed = 126;
    constexpr int notAuthorized = 127;
    if (status == dismissed || (!hasStarted_ && stop_.isPressed()))
        finish(contract::kPLErrorCancelled, contract::kPLVerdictStopped,
               "the authorisation was not given; nothing was done");
    else if (status == notAuthorized && !hasStarted_)
        finish(contract::kPLErrorNotAuthorized, contract::kPLVerdictFailed,
               job_.image ? "its tool needs it attached as a device of its own, for which you are "
                            "not authorised; nothing was done"
                          : "you are not authorised to work on this disk; nothing was done");
    else if (!hasStarted_)
        finish(contract::kPLErrorNotAuthorized, contract::kPLVerdictFailed,
               "it needs an administrator's rights, and they could not be asked for");
    else
        finish(contract::kPLErrorToolFailed, contract::kPLVerdictFailed,
               "the program that works on it as administrator ended unexpectedly");
}

void PrivilegedScript::finish(contract::ErrorCode error, contract::Name verdict,
                              std::string_view reason)
{
    tellUndone({error, verdict, {reason, {}, {}}}, request_, texts_, log_);
}

}  // namespace orvane
