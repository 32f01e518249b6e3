// SPDX-License-Identifier: Apache-2.0
#include "pellar/permissions/reader/ReaderMessages.h"

#include <sys/mman.h>
#include <sys/socket.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <cstring>

namespace pellar {
namespace {

constexpr std::size_t controlBytes = CMSG_SPACE(mostDescriptorsOfMessage * sizeof(int));

void takeDescriptors(msghdr& header, ReaderMessage& message)
{
    for (cmsghdr* part = CMSG_FIRSTHDR(&header); part != nullptr;
         part = CMSG_NXTHDR(&header, part)) {
        if (part->cmsg_level != SOL_SOCKET || part->cmsg_type != SCM_RIGHTS)
            continue;
        const std::size_t count = (part->cmsg_len - CMSG_LEN(0)) / sizeof(int);
        for (std::size_t i = 0; i < count; ++i) {
            int descriptor = -1;
            std::memcpy(&descriptor, CMSG_DATA(part) + i * sizeof(int), sizeof descriptor);
            message.descriptors.emplace_back(descriptor);
        }
    }
}

}  // namespace

bool sendMessage(int socket, std::string_view bytes, const std::vector<int>& descriptors)
{
    if (bytes.size() > largestReaderMessage || descriptors.size() > mostDescriptorsOfMessage)
        return false;
    iovec part{const_cast<char*>(bytes.data()), bytes.size()};
    msghdr header = {};
    header.msg_iov = &part;
    header.msg_iovlen = 1;
    alignas(cmsghdr) std::array<char, controlBytes> control{};
    if (!descriptors.empty()) {
        header.msg_control = control.data();
        header.msg_controllen = CMSG_SPACE(descriptors.size() * sizeof(int));
        cmsghdr* const rights = CMSG_FIRSTHDR(&header);
        rights->cmsg_level = SOL_SOCKET;
        rights->cmsg_type = SCM_RIGHTS;
        rights->cmsg_len = CMSG_LEN(descriptors.size() * sizeof(int));
        std::memcpy(CMSG_DATA(rights), descriptors.data(), descriptors.size() * sizeof(int));
    }
    ssize_t count = -1;
    do
        count = ::sendmsg(socket, &header, MSG_NOSIGNAL | MSG_DONTWAIT);
    while (count < 0 && errno == EINTR);
    return count == static_cast<ssize_t>(bytes.size());
}

std::optional<ReaderMessage> receiveMessage(int socket)
{
    ReaderMessage message;
    message.bytes.resize(largestReaderMessage);
    iovec part{message.bytes.data(), message.bytes.size()};
    alignas(cmsghdr) std::array<char, controlBytes> control{};
    msghdr header = {};
    header.msg_iov = &part;
    header.msg_iovlen = 1;
    header.msg_control = control.data();
    header.msg_controllen = control.size();
    ssize_t count = -1;
    do
        count = ::recvmsg(socket, &header, MSG_CMSG_CLOEXEC);
    while (count < 0 && errno == EINTR);
    if (count <= 0)
        return std::nullopt;
    takeDescriptors(header, message);
    if ((header.msg_flags & (MSG_TRUNC | MSG_CTRUNC)) != 0)
        return std::nullopt;
    message.bytes.resize(static_cast<std::size_t>(count));
    return message;
}

FileDescriptor memoryFileOf(std::string_view bytes)
{
    FileDescriptor file(::memfd_create("pellar", MFD_CLOEXEC));
    while (file && !bytes.empty()) {
        const ssize_t count = ::write(file.get(), bytes.data(), bytes.size());
        if (count < 0 && errno == EINTR)
            continue;
        if (count <= 0)
            return {};
        bytes.remove_prefix(static_cast<std::size_t>(count));
    }
    return file;
}

}  // namespace pellar
