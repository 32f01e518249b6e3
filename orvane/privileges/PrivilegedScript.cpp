// SPDX-License-Identifier: Apache-2.0
#include "orvane/privileges/PrivilegedScript.h"

#include "contract/pellar/ErrorCodes.h"
#include "contract/pellar/MessageKeys.h"
#include "pellar/process/Command.h"
#include "pellar/process/FileDescriptor.h"

#include <fcntl.h>
#include <poll.h>
#include <spawn.h>
#include <sys/socket.h>
#include <sys/types.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <csignal>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace orvane {
namespace {

/// With the standard signal handling, whatever ours is.
class SpawnAttributes {
public:
    SpawnAttributes()
    {
        ::posix_spawnattr_init(&attributes_);
        sigset_t signals;
        ::sigfillset(&signals);
        ::posix_spawnattr_setsigdefault(&attributes_, &signals);
        ::sigemptyset(&signals);
        ::posix_spawnattr_setsigmask(&attributes_, &signals);
        ::posix_spawnattr_setflags(&attributes_, POSIX_SPAWN_SETSIGDEF | POSIX_SPAWN_SETSIGMASK);
    }
    SpawnAttributes(const SpawnAttributes&) = delete;
    SpawnAttributes& operator=(const SpawnAttributes&) = delete;
    ~SpawnAttributes() { ::posix_spawnattr_destroy(&attributes_); }
    const posix_spawnattr_t* get() const { return &attributes_; }

private:
    posix_spawnattr_t attributes_{};
};

pid_t spawn(const std::vector<std::string>& command, int input, int output)
{
    std::vector<char*> arguments;
    for (const std::string& argument : command)
        arguments.push_back(const_cast<char*>(argument.c_str()));
    arguments.push_back(nullptr);
    posix_spawn_file_actions_t actions;
    ::posix_spawn_file_actions_init(&actions);
    ::posix_spawn_file_actions_adddup2(&actions, input, STDIN_FILENO);
    ::posix_spawn_file_actions_adddup2(&actions, output, STDOUT_FILENO);
    // What it says of itself is said by us, in the user's words. Passwords are asked for on the
    // terminal itself.
    ::posix_spawn_file_actions_addopen(&actions, STDERR_FILENO, "/dev/null", O_WRONLY, 0);
    const SpawnAttributes attributes;
    pid_t id = -1;
    if (::posix_spawn(&id, arguments[0], &actions, attributes.get(), arguments.data(), environ) !=
        0)
        id = -1;
    ::posix_spawn_file_actions_destroy(&actions);
    return id;
}

}  // namespace

/// A program that runs with more rights than ours, so it cannot be signalled: it is told to end
/// through its standard input, and ends in order when that closes. It stays in our process group,
/// where it can ask for a password on the terminal.
class HelperProcess {
public:
    /// None when it cannot be started.
    [[nodiscard]] static std::optional<HelperProcess> start(
        const std::vector<std::string>& command);
    HelperProcess(HelperProcess&& other) noexcept;
    HelperProcess& operator=(HelperProcess&&) = delete;
    /// Closes its input and waits for its end.
    ~HelperProcess();

    int output() const { return output_.get(); }
    /// Nothing happens when it has gone.
    void tell(std::string_view line);
    void closeInput() { input_.reset(); }
    /// Waits; the exit status, or none when it was killed. Once.
    std::optional<int> reap();

private:
    HelperProcess(pid_t id, FileDescriptor input, FileDescriptor output)
        : id_(id), input_(std::move(input)), output_(std::move(output))
    {
    }

    pid_t id_;
    FileDescriptor input_;
    FileDescriptor output_;
};

std::optional<HelperProcess> HelperProcess::start(const std::vector<std::string>& command)
{
    // A socket for its input: writing to one that has gone is an error, and no signal.
    int input[2];
    int output[2];
    if (::socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, input) != 0)
        return std::nullopt;
    FileDescriptor ourInput(input[0]);
    const FileDescriptor theirInput(input[1]);
    if (::pipe2(output, O_CLOEXEC) != 0)
        return std::nullopt;
    FileDescriptor ourOutput(output[0]);
    const FileDescriptor theirOutput(output[1]);
    const pid_t id = spawn(command, theirInput.get(), theirOutput.get());
    if (id < 0)
        return std::nullopt;
    return HelperProcess(id, std::move(ourInput), std::move(ourOutput));
}

HelperProcess::HelperProcess(HelperProcess&& other) noexcept
    : id_(std::exchange(other.id_, -1)),
      input_(std::move(other.input_)),
      output_(std::move(other.output_))
{
}

HelperProcess::~HelperProcess()
{
    closeInput();
    static_cast<void>(reap());
}

void HelperProcess::tell(std::string_view line)
{
    const std::string text = std::string(line) + "\n";
    if (input_)
        ::send(input_.get(), text.data(), text.size(), MSG_NOSIGNAL | MSG_DONTWAIT);
}

std::optional<int> HelperProcess::reap()
{
    if (id_ < 0)
        return std::nullopt;
    int status = 0;
    pid_t waited;
    do
        waited = ::waitpid(id_, &status, 0);
    while (waited < 0 && errno == EINTR);
    id_ = -1;
    return waited > 0 && WIFEXITED(status) ? std::optional(WEXITSTATUS(status)) : std::nullopt;
}

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
    if (!job_.policy.keptImage.empty()) {
        log_.started();
        fail(contract::kPLErrorNotAuthorized,
             "it takes an administrator's rights, and the repaired volume is not kept with those; "
             "nothing was done");
        return events_.flush();
    }
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

// What comes after the end is dropped. A result on an image waits for the end, when the
// image is looked at.
void PrivilegedScript::take(pellar::Event event)
{
    if (hasFinished_)
        return;
    asked();
    hasStarted_ = true;
    if (const auto advice = adviceIn(event)) {
        const std::string sentence = sentenceFor(*advice);
        if (sentence.empty())
            return;
        event = pellar::Message{
            {},
            contract::Dictionary::of({{contract::kFsckMessageString, std::string_view(sentence)},
                                      {contract::kFsckVerbosity, contract::verbosity::main}})};
    }
    if (auto* const end = std::get_if<pellar::Finished>(&event))
        takeEnd(std::move(*end));
    else if (!held_.empty() || (job_.image && isResult(event)))
        held_.push_back(std::move(event));
    else
        events_.add(std::move(event));
}

/// The helper does not know by which commands, or in which window, the user works.
std::string PrivilegedScript::sentenceFor(Advice advice) const
{
    switch (advice) {
        case Advice::Undo:
            return pellar::adviceFor(job_.disk, job_.task.subject == pellar::Subject::Permissions
                                                    ? launch_.advice.undoPermissions
                                                    : launch_.advice.undo);
        case Advice::Apply: return pellar::adviceFor(job_.disk, launch_.advice.apply);
        case Advice::RepairDirectly: break;
    }
    return pellar::adviceFor(job_.disk, launch_.advice.repairDirectly);
}

// What was found in a device on an image is true of nothing when the image was cut off or replaced
// in the meantime, which the device does not show.
void PrivilegedScript::takeEnd(pellar::Finished end)
{
    hasFinished_ = true;
    const bool isAnswer = job_.image && end.mainError != contract::kPLErrorCancelled;
    if (isAnswer && !job_.image->isStillWhole())
        return fail(contract::kPLErrorDiskChanged,
                    "the disk became shorter or unreadable meanwhile");
    if (isAnswer && !job_.image->isStillInPlace())
        return fail(contract::kPLErrorDiskChanged,
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
        fail(contract::kPLErrorCancelled, "the authorisation was not given; nothing was done",
             contract::kPLVerdictStopped);
    else if (status == notAuthorized && !hasStarted_)
        fail(contract::kPLErrorNotAuthorized,
             job_.image ? "its tool needs it attached as a device of its own, for which you are "
                          "not authorised; nothing was done"
                        : "you are not authorised to work on this disk; nothing was done");
    else if (!hasStarted_)
        fail(contract::kPLErrorNotAuthorized,
             "it needs an administrator's rights, and they could not be asked for");
    else
        fail(contract::kPLErrorToolFailed,
             "the program that works on it as administrator ended unexpectedly");
}

void PrivilegedScript::fail(contract::ErrorCode error, std::string_view reason,
                            contract::Name verdict)
{
    reportFailure({error, {reason, {}, {}}, verdict}, request_, texts_, log_);
}

}  // namespace orvane
