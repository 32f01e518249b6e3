// SPDX-License-Identifier: Apache-2.0
#include "tests/support/FailingDisk.h"

#include <fcntl.h>
#include <linux/fuse.h>
#include <sys/mount.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <stdexcept>
#include <type_traits>
#include <utility>

namespace orvane::test {
namespace {

constexpr std::uint64_t diskNode = 2;  // the directory is FUSE_ROOT_ID

template <class Message>
std::string_view bytesOf(const Message& message)
{
    static_assert(std::is_trivially_copyable_v<Message>);
    return {reinterpret_cast<const char*>(&message), sizeof message};
}

/// `bytes` hold at least one.
template <class Message>
Message messageIn(std::string_view bytes)
{
    Message message;
    std::memcpy(&message, bytes.data(), sizeof message);
    return message;
}

fuse_attr attributesOf(std::uint64_t node, std::uint64_t size)
{
    fuse_attr attributes = {};
    attributes.ino = node;
    attributes.size = node == diskNode ? size : 0;
    attributes.blocks = attributes.size / 512;
    attributes.mode = node == diskNode ? S_IFREG | 0666 : S_IFDIR | 0777;
    attributes.nlink = 1;
    attributes.blksize = 4096;
    return attributes;
}

}  // namespace

FailingDisk::FailingDisk(std::filesystem::path directory, const std::filesystem::path& backing,
                         std::vector<Bad> bad, Since since)
    : directory_(std::move(directory)),
      backing_(::open(backing.c_str(), O_RDWR | O_CLOEXEC)),
      fuse_(::open("/dev/fuse", O_RDWR | O_CLOEXEC)),
      size_(std::filesystem::file_size(backing)),
      bad_(std::move(bad)),
      since_(since)
{
    const std::string options =
        "fd=" + std::to_string(fuse_.get()) + ",rootmode=40000,user_id=0,group_id=0,allow_other";
    if (!backing_ || !fuse_ ||
        ::mount("failing-disk", directory_.c_str(), "fuse", 0, options.c_str()) != 0)
        throw std::runtime_error("cannot prepare the test: no FUSE file system can be mounted");
    server_ = std::thread([this] { serve(); });
}

FailingDisk::~FailingDisk()
{
    ::umount2(directory_.c_str(), MNT_DETACH);  // which ends the serving
    server_.join();
}

std::string FailingDisk::obstacle()
{
    if (::geteuid() != 0)
        return "needs root, to mount a FUSE file system";
    return ::access("/dev/fuse", R_OK | W_OK) == 0 ? "" : "needs /dev/fuse";
}

void FailingDisk::serve()
{
    std::vector<char> request(1U << 20U);
    for (;;) {
        const ssize_t count = ::read(fuse_.get(), request.data(), request.size());
        if (count < 0 && errno != EINTR && errno != ENOENT)
            return;
        if (count >= static_cast<ssize_t>(sizeof(fuse_in_header)))
            answer(request.data(), static_cast<std::size_t>(count));
    }
}

void FailingDisk::answer(const char* request, std::size_t bytes)
{
    const auto head = messageIn<fuse_in_header>({request, bytes});
    const std::string_view body(request + sizeof head, bytes - sizeof head);
    switch (head.opcode) {
        case FUSE_INIT: {
            fuse_init_out out = {};
            out.major = FUSE_KERNEL_VERSION;
            out.minor = 31;
            out.max_write = 131072;
            reply(head.unique, 0, bytesOf(out));
            break;
        }
        case FUSE_LOOKUP: look(head.unique, head.nodeid, body.substr(0, body.find('\0'))); break;
        case FUSE_GETATTR:
        case FUSE_SETATTR: {
            fuse_attr_out out = {};
            out.attr = attributesOf(head.nodeid, size_);
            reply(head.unique, 0, bytesOf(out));
            break;
        }
        case FUSE_OPEN: reply(head.unique, 0, bytesOf(fuse_open_out{})); break;
        case FUSE_READ: {
            const auto in = messageIn<fuse_read_in>(body);
            read(head.unique, in.offset, in.size);
            break;
        }
        case FUSE_WRITE: {
            const auto in = messageIn<fuse_write_in>(body);
            write(head.unique, in.offset, body.substr(sizeof in, in.size));
            break;
        }
        case FUSE_STATFS: reply(head.unique, 0, bytesOf(fuse_statfs_out{})); break;
        case FUSE_FORGET:
        case FUSE_BATCH_FORGET: break;        // want no answer
        default: reply(head.unique, ENOSYS);  // with which the kernel helps itself
    }
}

void FailingDisk::look(std::uint64_t id, std::uint64_t node, std::string_view name)
{
    if (node != FUSE_ROOT_ID || name != "disk")
        return reply(id, ENOENT);
    fuse_entry_out out = {};
    out.nodeid = diskNode;
    out.attr = attributesOf(diskNode, size_);
    reply(id, 0, bytesOf(out));
}

void FailingDisk::read(std::uint64_t id, std::uint64_t start, std::uint32_t bytes)
{
    if (isBad(start, bytes))
        return reply(id, EIO);
    std::string buffer(bytes, '\0');
    const ssize_t count =
        ::pread(backing_.get(), buffer.data(), buffer.size(), static_cast<off_t>(start));
    buffer.resize(count < 0 ? 0 : static_cast<std::size_t>(count));
    reply(id, 0, buffer);
}

void FailingDisk::write(std::uint64_t id, std::uint64_t start, std::string_view bytes)
{
    wasWritten_ = true;
    const ssize_t count =
        ::pwrite(backing_.get(), bytes.data(), bytes.size(), static_cast<off_t>(start));
    if (count < 0)
        return reply(id, errno);
    reply(id, 0, bytesOf(fuse_write_out{static_cast<std::uint32_t>(count), 0}));
}

void FailingDisk::reply(std::uint64_t id, int error, std::string_view bytes)
{
    fuse_out_header head{0, -error, id};
    head.len = static_cast<std::uint32_t>(sizeof head + bytes.size());
    std::string message(bytesOf(head));
    message += bytes;
    static_cast<void>(!::write(fuse_.get(), message.data(), message.size()));
}

bool FailingDisk::isBad(std::uint64_t start, std::uint64_t bytes) const
{
    if (since_ == Since::FirstWrite && !wasWritten_)
        return false;
    return std::any_of(bad_.begin(), bad_.end(), [&](const Bad& bad) {
        return bad.start < start + bytes && start < bad.end;
    });
}

}  // namespace orvane::test
