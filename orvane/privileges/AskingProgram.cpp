// SPDX-License-Identifier: Apache-2.0
#include "orvane/privileges/AskingProgram.h"

#include "contract/pellar/MessageKeys.h"
#include "orvane/support/files/WholeFile.h"

#include <fcntl.h>
#include <pwd.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <array>
#include <cstdio>
#include <cstring>
#include <optional>
#include <string>

namespace orvane {
namespace {

std::string directoryOf(pid_t id)
{
    return "/proc/" + std::to_string(id);
}

/// "Uid:\t1000\t1000\t1000\t1000": the real, effective, saved and file system's user (proc(5)).
bool areAllUsers(const std::string& status, uid_t user)
{
    const std::size_t line = status.find("\nUid:");
    std::array<unsigned, 4> ids{};
    if (line == std::string::npos || std::sscanf(status.c_str() + line, "\nUid: %u %u %u %u",
                                                 &ids[0], &ids[1], &ids[2], &ids[3]) != 4)
        return false;
    return ids == std::array{user, user, user, user};
}

/// What /proc tells of a program that has, or had, other rights than its user's belongs to root
/// (proc(5), prctl(2) PR_SET_DUMPABLE). The directory of the program itself does not.
bool hasOnlyUsersRights(pid_t id, uid_t user)
{
    struct stat descriptors = {};
    if (::stat((directoryOf(id) + "/fd").c_str(), &descriptors) != 0 || descriptors.st_uid != user)
        return false;
    const auto status = readWholeFile(directoryOf(id) + "/status", 65536);
    return status && areAllUsers(*status, user);
}

using pellar::Access;

/// How the file is open; none when it can be neither read nor written through the descriptor.
std::optional<Access> accessOf(int file)
{
    const int flags = ::fcntl(file, F_GETFL);
    if (flags < 0 || (flags & O_PATH) != 0)
        return std::nullopt;
    switch (flags & O_ACCMODE) {
        case O_RDONLY: return Access::ReadOnly;
        case O_RDWR: return Access::ReadWrite;
        default: return std::nullopt;
    }
}

bool isInside(const contract::DiskReference& region, int file)
{
    struct stat status = {};
    if (::fstat(file, &status) != 0 || !S_ISREG(status.st_mode))
        return false;
    const auto size = static_cast<std::uint64_t>(status.st_size);
    return region.offset <= size && region.length <= size - region.offset;
}

}  // namespace

// The parent's number cannot have passed to another program while it is still the parent's.
bool AskingProgram::isStillUsers() const
{
    return ::getppid() == id_ && hasOnlyUsersRights(id_, user_) && ::getppid() == id_;
}

std::optional<AskingProgram> AskingProgram::of(uid_t user)
{
    const pid_t id = ::getppid();
    FileDescriptor process(static_cast<int>(::syscall(SYS_pidfd_open, id, 0)));
    AskingProgram program(id, user, std::move(process));
    if (!program.process_ || !program.isStillUsers())
        return std::nullopt;
    return program;
}

// Asked again afterwards: in between it may have become a program that runs with other rights.
FileDescriptor AskingProgram::take(int descriptor) const
{
    FileDescriptor file(
        static_cast<int>(::syscall(SYS_pidfd_getfd, process_.get(), descriptor, 0)));
    return isStillUsers() ? std::move(file) : FileDescriptor();
}

pellar::Result<pellar::LoopDevice, JobFailure> attachRegion(const FileDescriptor& image,
                                                            const HelperRequest& request)
{
    const Access wanted = accessFor(request.task.operation, request.policy);
    const auto given = accessOf(image.get());
    if (!given || !isInside(request.disk, image.get()))
        return JobFailure{contract::kPLErrorCannotOpen,
                          {"it is not a part of an image that you have opened", {}, {}}};
    if (wanted == Access::ReadWrite && given == Access::ReadOnly)
        return JobFailure{contract::kPLErrorReadOnly, {"you may not write to the image", {}, {}}};
    auto device =
        pellar::LoopDevice::attach(image.get(), request.disk.offset, request.disk.length, wanted);
    if (!device)
        return JobFailure{
            contract::kPLErrorCannotOpen,
            {"it could not be attached as a device: %1$@", ::strerrordesc_np(device.error()), {}}};
    return *std::move(device);
}

std::filesystem::path homeDirectoryOf(uid_t user)
{
    passwd entry = {};
    passwd* found = nullptr;
    std::array<char, 16384> buffer;
    if (::getpwuid_r(user, &entry, buffer.data(), buffer.size(), &found) != 0 || found == nullptr)
        return {};
    return found->pw_dir;
}

}  // namespace orvane
