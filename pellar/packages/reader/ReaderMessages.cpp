// SPDX-License-Identifier: Apache-2.0
#include "pellar/packages/reader/ReaderMessages.h"

#include "pellar/packages/TextLines.h"

#include <sys/mman.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstdint>
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

ReaderMessage BrokeredServices::ask(Question question, std::string_view bytes, int descriptor) const
{
    const std::string packet = static_cast<char>(question) + std::string(bytes);
    std::optional<ReaderMessage> answer;
    if (sendMessage(socket_, packet,
                    descriptor < 0 ? std::vector<int>() : std::vector<int>{descriptor}))
        answer = receiveMessage(socket_);
    if (!answer)
        ::_exit(1);
    return *std::move(answer);
}

FileDescriptor BrokeredServices::askForFile(Question question, std::string_view bytes) const
{
    if (bytes.size() >= largestReaderMessage)
        return {};
    ReaderMessage answer = ask(question, bytes);
    return answer.descriptors.empty() ? FileDescriptor() : std::move(answer.descriptors.front());
}

FileDescriptor BrokeredServices::openFile(const std::string& path) const
{
    return askForFile(Question::OpenFile, path);
}

std::vector<std::string> BrokeredServices::names(const std::string& directory) const
{
    const FileDescriptor list = askForFile(Question::Names, directory);
    const auto text = list ? contentsOf(list.get(), SIZE_MAX / 2) : std::nullopt;
    std::vector<std::string> names;
    for (std::string_view rest = text ? std::string_view(*text) : ""; !rest.empty();)
        names.emplace_back(takeField(rest, '\0'));
    return names;
}

FileDescriptor BrokeredServices::open(const std::string& digest) const
{
    return askForFile(Question::OpenKept, digest);
}

void BrokeredServices::keep(const std::string& digest, std::string_view mtree)
{
    if (const FileDescriptor file = memoryFileOf(mtree))
        static_cast<void>(ask(Question::Keep, digest, file.get()));
}

std::vector<FileDescriptor> BrokeredServices::fetch(std::span<const DpkgPackage> packages) const
{
    std::string list;
    for (const DpkgPackage& package : packages)
        list += package.name + ' ' + package.version + ' ' + package.architecture + '\n';
    ReaderMessage answer = ask(Question::Fetch, list);
    std::vector<FileDescriptor> archives;
    auto next = answer.descriptors.begin();
    for (const char isThere : answer.bytes)
        archives.push_back(isThere == '1' && next != answer.descriptors.end() ? std::move(*next++)
                                                                              : FileDescriptor());
    return archives;
}

bool BrokeredServices::progress(double percent) const
{
    std::string bytes(sizeof percent, '\0');
    std::memcpy(bytes.data(), &percent, sizeof percent);
    return ask(Question::Progress, bytes).bytes == "1";
}

}  // namespace pellar
