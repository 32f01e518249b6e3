// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/udisks/DirectDisks.h"

#include "pellar/disks/LoopDevice.h"
#include "pellar/mounts/MountPoint.h"
#include "pellar/process/FileDescriptor.h"

#include <fcntl.h>
#include <libmount/libmount.h>
#include <linux/cdrom.h>
#include <linux/loop.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include <cerrno>
#include <memory>

namespace orvane {

std::vector<pellar::Mount> placesOf(const std::string& node)
{
    return pellar::mountsOf(std::filesystem::path(node), pellar::SystemPaths());
}

namespace {

struct Free {
    void operator()(libmnt_table* table) const { mnt_unref_table(table); }
    void operator()(libmnt_cache* cache) const { mnt_unref_cache(cache); }
    void operator()(libmnt_context* context) const { mnt_free_context(context); }
};

/// One mount or unmount by libmount; null when there is no memory.
using MountContext = std::unique_ptr<libmnt_context, Free>;

/// What libmount's answer to it means: 0, or an errno value. The library answers its own failures
/// negative, and a system call's with a status of its own (libmount's documentation, "Mount
/// context"). A helper, such as that of NTFS-3G, has neither and told its own standard error: EIO.
int errorOf(const MountContext& context, int answer)
{
    const bool hasHelperFailed = mnt_context_helper_executed(context.get()) == 1 &&
                                 mnt_context_get_helper_status(context.get()) != 0;
    if (answer == 0)
        return hasHelperFailed ? EIO : 0;
    const int error = mnt_context_get_syscall_errno(context.get());
    return error != 0 ? error : answer < 0 ? -answer : EINVAL;
}

Refusal refusalOf(int error)
{
    switch (error) {
        case EBUSY: return {Refusal::Kind::Busy, {}};
        case EPERM:
        case EACCES: return {Refusal::Kind::NotAllowed, {}};
        default: return {Refusal::Kind::Other, errorText(error)};
    }
}

Result<void, Refusal> answerOf(int error)
{
    if (error != 0)
        return refusalOf(error);
    return {};
}

/// Where the table says that the device belongs; empty where it says nothing. The cache knows
/// devices by their labels and UUIDs, too.
std::string targetInTable(const std::string& node)
{
    const std::unique_ptr<libmnt_table, Free> table(mnt_new_table());
    const std::unique_ptr<libmnt_cache, Free> cache(mnt_new_cache());
    if (!table || !cache || mnt_table_set_cache(table.get(), cache.get()) != 0 ||
        mnt_table_parse_fstab(table.get(), nullptr) != 0)
        return {};
    libmnt_fs* const entry = mnt_table_find_source(table.get(), node.c_str(), MNT_ITER_FORWARD);
    const char* const target = entry != nullptr ? mnt_fs_get_target(entry) : nullptr;
    return target != nullptr && *target == '/' ? target : "";
}

Result<void, Refusal> control(const std::string& node, unsigned long request)
{
    const pellar::FileDescriptor device(::open(node.c_str(), O_RDONLY | O_NONBLOCK | O_CLOEXEC));
    return answerOf(!device || ::ioctl(device.get(), request, 0) != 0 ? errno : 0);
}

}  // namespace

bool DirectDisks::isAllowed()
{
    return ::geteuid() == 0;
}

Result<void, Refusal> DirectDisks::mount(const std::string& node)
{
    const std::string target = targetInTable(node);
    if (target.empty())
        return Refusal{Refusal::Kind::NoTable, {}};
    const MountContext context(mnt_new_context());
    if (!context)
        return refusalOf(ENOMEM);
    // By its target alone, libmount takes the rest from the table.
    mnt_context_set_target(context.get(), target.c_str());
    return answerOf(errorOf(context, mnt_context_mount(context.get())));
}

Result<void, Refusal> DirectDisks::unmount(const std::string& node)
{
    auto places = placesOf(node);
    if (places.empty())
        return Refusal{Refusal::Kind::AlreadySo, {}};
    // The last one first: it may lie over or below the others.
    for (; !places.empty(); places.pop_back()) {
        const MountContext context(mnt_new_context());
        if (!context)
            return refusalOf(ENOMEM);
        if (isCovered(places.back(), places))
            return refusalOf(EBUSY);
        mnt_context_set_target(context.get(), places.back().target.c_str());
        if (const int error = errorOf(context, mnt_context_umount(context.get())))
            return refusalOf(error);
    }
    return {};
}

Result<void, Refusal> DirectDisks::eject(const std::string& node)
{
    const auto answer = control(node, CDROMEJECT);
    if (!answer && answer.error().kind == Refusal::Kind::Other)
        return Refusal{Refusal::Kind::CannotEject, {}};
    return answer;
}

Result<void, Refusal> DirectDisks::detachLoop(const std::string& node)
{
    return control(node, LOOP_CLR_FD);
}

Result<std::string, Refusal> DirectDisks::setUpLoop(int file, pellar::Access access)
{
    const auto made = pellar::setUpLoop(file, 0, 0, access, pellar::LoopLife::UntilDetached);
    if (!made)
        return refusalOf(made.error());
    return "/dev/" + made->name;
}

}  // namespace orvane
