// SPDX-License-Identifier: Apache-2.0
#include "orvane/privileges/HelperJob.h"

#include "contract/pellar/MessageKeys.h"
#include "orvane/privileges/AskingProgram.h"
#include "orvane/privileges/AttachedRegion.h"
#include "orvane/privileges/HelperConversation.h"
#include "orvane/privileges/HomeDirectory.h"
#include "orvane/privileges/MountedSystem.h"
#include "orvane/privileges/UndoneJob.h"
#include "pellar/Manager.h"

#include <fcntl.h>

#include <cerrno>
#include <cstring>
#include <memory>
#include <utility>

namespace orvane {
namespace {

using contract::DiskReference;
using contract::ErrorCode;
using pellar::Subject;

// Where sectors are kept that the repair of a partition map overwrites, and what archives have
// said about their packages' files.
constexpr const char* savedSectors = "/var/lib/orvane/partition-maps";
constexpr const char* permissionReferences = "/var/lib/orvane/permissions";

std::variant<AttachedRegion, Undone> attachedRegion(const HelperRequest& request,
                                                    std::optional<uid_t> user)
{
    const auto program = user ? AskingProgram::of(*user) : std::nullopt;
    if (!program)
        return Undone{contract::kPLErrorCannotOpen,
                      contract::kPLVerdictFailed,
                      {"the program that asked for it has gone, or is not yours", {}, {}}};
    return AttachedRegion::attach(program->take(request.image), request);
}

/// One job, with what it stands on.
class HelperJob {
public:
    HelperJob(const HelperRequest& request, std::optional<uid_t> user, const pellar::Texts& texts)
        : request_(request), user_(user), texts_(texts)
    {
    }

    void run()
    {
        const auto undone = prepare();
        if (!undone)
            work();
        else
            refuse(*undone);
    }

private:
    std::optional<Undone> prepare()
    {
        disk_ = request_.disk;
        if (request_.isOnImage())
            return attach();
        if (auto undone = holdDevice())
            return undone;
        return request_.subject == Subject::Permissions ? findSystem() : std::nullopt;
    }

    // While it is open its number goes to no other disk, so that what the job opens by the name is
    // this one.
    std::optional<Undone> holdDevice()
    {
        device_ = FileDescriptor(
            ::open(disk_.path.c_str(), O_RDONLY | O_NONBLOCK | O_NOCTTY | O_NOFOLLOW | O_CLOEXEC));
        if (!device_)
            return Undone{contract::kPLErrorCannotOpen,
                          contract::kPLVerdictFailed,
                          {"it cannot be opened: %1$@", ::strerrordesc_np(errno), {}}};
        if (!request_.identity.isStill(identityOf(device_)))
            return Undone{
                contract::kPLErrorDiskChanged,
                contract::kPLVerdictFailed,
                {"the disk changed: another one has its name now; nothing was done", {}, {}}};
        return std::nullopt;
    }

    std::optional<Undone> findSystem()
    {
        const auto place = mountedSystemOn(disk_.path);
        if (const auto* const reason = std::get_if<pellar::Sentence>(&place))
            return Undone{contract::kPLErrorUnsupported, contract::kPLVerdictFailed, *reason};
        disk_.mountPoint = std::get<std::string>(place);
        return std::nullopt;
    }

    std::optional<Undone> attach()
    {
        auto region = attachedRegion(request_, user_);
        if (auto* const undone = std::get_if<Undone>(&region))
            return std::move(*undone);
        region_.emplace(std::get<AttachedRegion>(std::move(region)));
        disk_ = region_->disk(request_);
        return std::nullopt;
    }

    void work()
    {
        pellar::JobOptions options;
        options.savedSectorsDirectory = savedSectors;
        options.permissionReferences = permissionReferences;
        if (user_)
            options.homeDirectory = homeDirectoryOf(*user_);
        options.archiveFetching.isAllowed = [this] {
            return request_.fetchesArchives;
        };
        options.commandTrace = [this](std::string_view line) {
            teller_.trace(line);
        };
        pellar::Manager manager(loop_, texts_, options);
        manager.setDelegate(&teller_);
        const auto tool = manager.makeRepairDisk();
        // A refusal to begin has no events of its own; its number tells whoever asked.
        if (const ErrorCode error = begin(*tool)) {
            teller_.plAsyncStartedForDisk(nullptr);
            teller_.plAsyncFinishedForDisk(nullptr, error, 0, {});
            return;
        }
        const StopLine stop(loop_, [&tool] { tool->cancelCurrentOperation(); });
        loop_.runUntil([this] { return teller_.isOver(); });
    }

    ErrorCode begin(contract::PLRepairDisk& tool) const
    {
        const auto disk = std::make_shared<const DiskReference>(disk_);
        const bool isRepair = request_.operation == pellar::Operation::Repair;
        switch (request_.subject) {
            case Subject::PartitionMap:
                return isRepair ? tool.beginPartitionMapRepairForDisk(disk)
                                : tool.beginPartitionMapVerifyForDisk(disk);
            case Subject::Permissions:
                return isRepair ? tool.beginPermissionsRepairForDisk(disk)
                                : tool.beginPermissionsVerifyForDisk(disk);
            case Subject::Filesystem: break;
        }
        return isRepair ? tool.beginStoragesystemFilesystemRepairForDisk(disk)
                        : tool.beginStoragesystemFilesystemVerifyForDisk(disk);
    }

    void refuse(const Undone& undone)
    {
        pellar::EventQueue events(loop_, {&teller_, nullptr, {}, [] {
                                       }});
        pellar::JobLog log(request_.disk, texts_, events);
        log.started();
        tellUndone(undone, request_, texts_, log);
        loop_.runUntil([this] { return teller_.isOver(); });
    }

    const HelperRequest& request_;
    const std::optional<uid_t> user_;
    const pellar::Texts& texts_;
    MainLoop loop_;
    Teller teller_;
    DiskReference disk_;
    FileDescriptor device_;
    std::optional<AttachedRegion> region_;  ///< given back last
};

}  // namespace

void runHelperJob(const HelperRequest& request, std::optional<uid_t> user,
                  const pellar::Texts& texts)
{
    HelperJob(request, user, texts).run();
}

}  // namespace orvane
