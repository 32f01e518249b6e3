// SPDX-License-Identifier: Apache-2.0
#include "orvane/privileges/HelperJob.h"

#include "contract/pellar/MessageKeys.h"
#include "contract/pellar/PLRepairDisk.h"
#include "orvane/privileges/AskingProgram.h"
#include "orvane/privileges/LibraryOptions.h"
#include "orvane/privileges/MountedSystem.h"
#include "orvane/support/loop/MainLoop.h"
#include "pellar/Manager.h"
#include "pellar/RepairDisk.h"
#include "pellar/disks/LoopDevice.h"
#include "pellar/jobs/EventQueue.h"

#include <fcntl.h>
#include <poll.h>
#include <sys/random.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <cstring>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <system_error>
#include <utility>

namespace orvane {
namespace {

using contract::DiskReference;
using contract::ErrorCode;
using pellar::Subject;

// Where it is kept what archives have said about their packages' files.
constexpr const char* permissionReferences = "/var/lib/orvane/permissions";

bool write(const std::string& line)
{
    const std::string text = line + "\n";
    for (std::size_t done = 0; done < text.size();) {
        const ssize_t count = ::write(STDOUT_FILENO, text.data() + done, text.size() - done);
        if (count <= 0 && errno != EINTR)
            return false;
        done += count > 0 ? static_cast<std::size_t>(count) : 0;
    }
    return true;
}

/// Prints what happens in the job: a line for each event on standard output, while it is read.
class EventPrinter final : public contract::PLAsyncDelegate {
public:
    void plAsyncStartedForDisk(const contract::DiskReferencePointer&) override
    {
        print(pellar::Started{});
    }
    void plAsyncMessageForDisk(const contract::DiskReferencePointer&, std::string_view string,
                               const contract::Dictionary& dictionary) override
    {
        for (const Advice advice : {Advice::Undo, Advice::Apply, Advice::RepairDirectly})
            if (dictionary.string(contract::kFsckMessageString) == markOf(advice))
                return print(messageOf(advice));
        print(pellar::Message{std::string(string), dictionary});
    }
    void plAsyncProgressForDisk(const contract::DiskReferencePointer&, bool, float) override {}
    void plAsyncFinishedForDisk(const contract::DiskReferencePointer&, ErrorCode mainError,
                                ErrorCode detailError, const contract::Dictionary& result) override
    {
        isOver_ = true;
        print(pellar::Finished{mainError, detailError, result});
    }

    void trace(std::string_view line) { print(pellar::Trace{std::string(line)}); }
    bool isOver() const { return isOver_; }
    /// What the library is given to tell instead of a sentence; nothing on a disk can know it.
    std::string markOf(Advice advice) const
    {
        return secret_ + std::to_string(static_cast<int>(advice));
    }

private:
    static std::string makeSecret()
    {
        std::array<std::uint64_t, 2> random{};
        if (::getrandom(random.data(), sizeof random, 0) != sizeof random)
            throw std::system_error(errno, std::generic_category(), "getrandom");
        return std::to_string(random[0]) + "-" + std::to_string(random[1]) + "-";
    }

    void print(const pellar::Event& event) { isRead_ = isRead_ && write(lineFromEvent(event)); }

    bool isOver_ = false;
    bool isRead_ = true;
    const std::string secret_ = makeSecret();
};

/// Reads from standard input what is wanted: each "stop" presses, and so does the end of the input,
/// when the program that asked has gone. The loop outlives it.
class StopInput {
public:
    StopInput(MainLoop& loop, std::function<void()> pressed)
        : loop_(loop), pressed_(std::move(pressed))
    {
        loop_.watch(STDIN_FILENO, POLLIN, [this](short) { read(); });
    }
    StopInput(const StopInput&) = delete;
    StopInput& operator=(const StopInput&) = delete;
    ~StopInput() { loop_.unwatch(STDIN_FILENO); }

private:
    void read()
    {
        char buffer[64];
        const ssize_t count = ::read(STDIN_FILENO, buffer, sizeof buffer);
        if (count <= 0)
            loop_.unwatch(STDIN_FILENO);
        if (count == 0)
            pressed_();
        for (ssize_t i = 0; i < count; ++i)
            if (buffer[i] == '\n')
                pressed_();
    }

    MainLoop& loop_;
    const std::function<void()> pressed_;
};

/// One job, with what it stands on.
class HelperJob {
public:
    HelperJob(const HelperRequest& request, std::optional<uid_t> user, const pellar::Texts& texts)
        : request_(request), user_(user), texts_(texts)
    {
    }

    void run()
    {
        if (const auto failure = prepare())
            refuse(*failure);
        else
            work();
    }

private:
    std::optional<JobFailure> prepare()
    {
        disk_ = request_.disk;
        if (request_.isOnImage())
            return attach();
        if (auto failure = holdDevice())
            return failure;
        return request_.task.subject == Subject::Permissions ? findSystem() : std::nullopt;
    }

    // While it is open its number goes to no other disk, so that what the job opens by the name is
    // this one.
    std::optional<JobFailure> holdDevice()
    {
        device_ = FileDescriptor(
            ::open(disk_.path.c_str(), O_RDONLY | O_NONBLOCK | O_NOCTTY | O_NOFOLLOW | O_CLOEXEC));
        if (!device_)
            return JobFailure{contract::kPLErrorCannotOpen,
                              {"it cannot be opened: %1$@", ::strerrordesc_np(errno), {}}};
        if (!request_.identity.isStill(identityOf(device_)))
            return JobFailure{
                contract::kPLErrorDiskChanged,
                {"the disk changed: another one has its name now; nothing was done", {}, {}}};
        return std::nullopt;
    }

    std::optional<JobFailure> findSystem()
    {
        const auto place = mountedSystemOn(disk_.path);
        if (!place)
            return JobFailure{contract::kPLErrorUnsupported, place.error()};
        disk_.mountPoint = *place;
        return std::nullopt;
    }

    std::optional<JobFailure> attach()
    {
        const auto program = user_ ? AskingProgram::of(*user_) : std::nullopt;
        if (!program)
            return JobFailure{contract::kPLErrorCannotOpen,
                              {"the program that asked for it has gone, or is not yours", {}, {}}};
        auto region = attachRegion(program->take(request_.image), request_);
        if (!region)
            return std::move(region).error();
        region_.emplace(*std::move(region));
        disk_.storage = DiskReference::Storage::BlockDevice;
        disk_.path = region_->node();
        disk_.offset = 0;
        return std::nullopt;
    }

    void work()
    {
        pellar::JobOptions options;
        options.permissionReferences = permissionReferences;
        if (user_)
            options.homeDirectory = homeDirectoryOf(*user_);
        options.archiveFetching.isAllowed = [this] {
            return request_.fetchesArchives;
        };
        options.commandTrace = [this](std::string_view line) {
            printer_.trace(line);
        };
        options.repairPolicy = [this] {
            return request_.policy;
        };
        options.trials = trials();
        pellar::Manager manager(loop_, texts_, options);
        const auto tool = manager.makeTool(printer_);
        // A refusal to begin has no events of its own; its number goes to the program that asked.
        if (const ErrorCode error =
                tool->begin(request_.task, std::make_shared<const DiskReference>(disk_))) {
            printer_.plAsyncStartedForDisk(nullptr);
            printer_.plAsyncFinishedForDisk(nullptr, error, 0, {});
            return;
        }
        const StopInput stop(loop_, [&tool] { tool->cancelCurrentOperation(); });
        loop_.runUntil([this] { return printer_.isOver(); });
    }

    pellar::Trials trials() const
    {
        pellar::Trials trials;
        trials.room.directory = systemRepairs;
        trials.isPublic = true;
        trials.user = user_.value_or(::getuid());
        // The user's own commands do not find what is kept here of an image.
        if (request_.isOnImage())
            return trials;
        const auto asked = [this](Advice advice) {
            return [mark = printer_.markOf(advice)](const DiskReference&) {
                return mark;
            };
        };
        trials.howToUndo = asked(Advice::Undo);
        trials.howToUndoPermissions = asked(Advice::Undo);
        trials.howToApply = asked(Advice::Apply);
        trials.howToRepairDirectly = asked(Advice::RepairDirectly);
        return trials;
    }

    void refuse(const JobFailure& failure)
    {
        pellar::EventQueue events(loop_, {&printer_, nullptr, {}, [] {
                                          }});
        pellar::JobLog log(request_.disk, texts_, events);
        log.started();
        reportFailure(failure, request_, texts_, log);
        loop_.runUntil([this] { return printer_.isOver(); });
    }

    const HelperRequest& request_;
    const std::optional<uid_t> user_;
    const pellar::Texts& texts_;
    MainLoop loop_;
    EventPrinter printer_;
    DiskReference disk_;
    FileDescriptor device_;
    std::optional<pellar::LoopDevice> region_;  ///< given back last
};

}  // namespace

void runHelperJob(const HelperRequest& request, std::optional<uid_t> user,
                  const pellar::Texts& texts)
{
    HelperJob(request, user, texts).run();
}

}  // namespace orvane
