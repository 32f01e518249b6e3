// SPDX-License-Identifier: Apache-2.0
#include "pellar/overlay/FuseMount.h"

#include "pellar/process/ChildProcess.h"

#include <fcntl.h>
#include <sched.h>
#include <sys/mount.h>
#include <sys/socket.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <charconv>
#include <cstring>
#include <string>

namespace pellar {
namespace {

// What follows up to `sendMount` also runs in a forked child, so it takes no memory
// (signal-safety(7)).

struct RawMount {
    int channel = -1;
    int root = -1;
    int error = 0;
};

bool set(int context, const char* key, const char* value)
{
    return ::fsconfig(context, FSCONFIG_SET_STRING, key, value, 0) == 0;
}

/// With user and group 0 of the user namespace in which it is called.
RawMount mountHere() noexcept
{
    RawMount mount;
    mount.channel = ::open("/dev/fuse", O_RDWR | O_CLOEXEC);
    const int context = mount.channel < 0 ? -1 : ::fsopen("fuse", FSOPEN_CLOEXEC);
    if (context < 0) {
        mount.error = errno;
        return mount;
    }
    std::array<char, 16> channel{};
    std::to_chars(channel.data(), channel.data() + channel.size() - 1, mount.channel);
    const bool isReady = set(context, "source", "pellar-overlay") &&
                         set(context, "fd", channel.data()) && set(context, "rootmode", "40000") &&
                         set(context, "user_id", "0") && set(context, "group_id", "0") &&
                         ::fsconfig(context, FSCONFIG_CMD_CREATE, nullptr, nullptr, 0) == 0;
    if (isReady)
        mount.root = ::fsmount(context, FSMOUNT_CLOEXEC,
                               MOUNT_ATTR_NOSUID | MOUNT_ATTR_NODEV | MOUNT_ATTR_NOEXEC);
    mount.error = mount.root < 0 ? errno : 0;
    ::close(context);
    return mount;
}

bool writeFile(const char* path, const char* text) noexcept
{
    const int file = ::open(path, O_WRONLY | O_CLOEXEC);
    const auto length = static_cast<ssize_t>(std::strlen(text));
    const bool isWritten = file >= 0 && ::write(file, text, std::strlen(text)) == length;
    const int error = errno;
    if (file >= 0)
        ::close(file);
    errno = error;
    return isWritten;
}

/// The lines that make this user the namespace's root (user_namespaces(7)); made before the fork.
struct OwnMaps {
    std::string users = "0 " + std::to_string(::geteuid()) + " 1";
    std::string groups = "0 " + std::to_string(::getegid()) + " 1";
};

bool enterOwnNamespace(const OwnMaps& maps) noexcept
{
    return ::unshare(CLONE_NEWUSER | CLONE_NEWNS) == 0 &&
           writeFile("/proc/self/uid_map", maps.users.c_str()) &&
           writeFile("/proc/self/setgroups", "deny") &&
           writeFile("/proc/self/gid_map", maps.groups.c_str());
}

constexpr std::size_t descriptorBytes = 2 * sizeof(int);

/// A message of the error, with the two descriptors where there is none.
struct MountMessage {
    int error = 0;
    iovec bytes{&error, sizeof error};
    alignas(cmsghdr) std::array<char, CMSG_SPACE(descriptorBytes)> control{};
    msghdr header{};

    MountMessage()
    {
        header.msg_iov = &bytes;
        header.msg_iovlen = 1;
        header.msg_control = control.data();
        header.msg_controllen = control.size();
    }
    MountMessage(const MountMessage&) = delete;
    MountMessage& operator=(const MountMessage&) = delete;
};

[[noreturn]] void sendMount(int socket, const OwnMaps& maps) noexcept
{
    MountMessage message;
    RawMount mount;
    if (!enterOwnNamespace(maps))
        message.error = errno;
    else
        mount = mountHere();
    message.error = message.error == 0 ? mount.error : message.error;
    if (message.error == 0) {
        cmsghdr* const head = CMSG_FIRSTHDR(&message.header);
        head->cmsg_level = SOL_SOCKET;
        head->cmsg_type = SCM_RIGHTS;
        head->cmsg_len = CMSG_LEN(descriptorBytes);
        const int sent[]{mount.channel, mount.root};
        std::memcpy(CMSG_DATA(head), sent, sizeof sent);
    } else {
        message.header.msg_controllen = 0;
    }
    ::_exit(::sendmsg(socket, &message.header, MSG_NOSIGNAL) > 0 ? 0 : 1);
}

Result<FuseMount, int> receiveMount(int socket)
{
    MountMessage message;
    ssize_t count = 0;
    do
        count = ::recvmsg(socket, &message.header, MSG_CMSG_CLOEXEC);
    while (count < 0 && errno == EINTR);
    if (count != sizeof message.error)
        return count < 0 ? errno : EPERM;  // the child could not even say why
    if (message.error != 0)
        return message.error;
    const cmsghdr* const head = CMSG_FIRSTHDR(&message.header);
    if (head == nullptr || head->cmsg_type != SCM_RIGHTS ||
        head->cmsg_len != CMSG_LEN(descriptorBytes))
        return EMFILE;  // no descriptors were left to receive them
    int received[2];
    std::memcpy(received, CMSG_DATA(head), sizeof received);
    return FuseMount{FileDescriptor(received[0]), FileDescriptor(received[1])};
}

Result<FuseMount, int> mountInOwnNamespace()
{
    int ends[2];
    if (::socketpair(AF_UNIX, SOCK_SEQPACKET | SOCK_CLOEXEC, 0, ends) != 0)
        return errno;
    const FileDescriptor ours(ends[0]);
    FileDescriptor theirs(ends[1]);
    const OwnMaps maps;
    const SignalsBlocked blocked;
    const pid_t child = ::fork();
    if (child == 0)
        sendMount(theirs.get(), maps);
    if (child < 0)
        return errno;
    theirs.reset();
    auto mount = receiveMount(ours.get());
    while (::waitpid(child, nullptr, 0) < 0 && errno == EINTR) {
    }
    return mount;
}

}  // namespace

Result<FuseMount, int> mountDetached()
{
    RawMount mount = mountHere();
    FuseMount owned{FileDescriptor(mount.channel), FileDescriptor(mount.root)};
    if (mount.error == 0)
        return owned;
    return mount.error == EPERM ? mountInOwnNamespace() : mount.error;
}

}  // namespace pellar
