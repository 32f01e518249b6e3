// SPDX-License-Identifier: Apache-2.0
#include "pellar/overlay/OverlayFile.h"

#include "pellar/process/ChildProcess.h"

#define FUSE_USE_VERSION 312
#include <fcntl.h>
#include <fuse3/fuse_lowlevel.h>
#include <poll.h>
#include <sys/eventfd.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <string>
#include <utility>
#include <vector>

namespace pellar {
namespace {

constexpr const char* nameOfFile = "disk";
constexpr fuse_ino_t numberOfFile = 2;  // the directory is FUSE_ROOT_ID
constexpr double forEver = 86400;       // seconds; nothing but this process changes it
constexpr unsigned largestRequest = 1U << 20U;

Overlay& overlayOf(fuse_req_t request)
{
    return *static_cast<Overlay*>(::fuse_req_userdata(request));
}

struct stat statusOf(fuse_req_t request, fuse_ino_t number)
{
    struct stat status = {};
    const bool isFile = number == numberOfFile;
    status.st_ino = number;
    status.st_mode = isFile ? S_IFREG | 0600 : S_IFDIR | 0700;
    status.st_nlink = 1;
    status.st_size = isFile ? static_cast<off_t>(overlayOf(request).bytes()) : 0;
    status.st_blocks = (status.st_size + 511) / 512;
    status.st_blksize = 4096;
    return status;
}

void look(fuse_req_t request, fuse_ino_t parent, const char* name)
{
    if (parent != FUSE_ROOT_ID || std::strcmp(name, nameOfFile) != 0) {
        ::fuse_reply_err(request, ENOENT);
        return;
    }
    fuse_entry_param entry = {};
    entry.ino = numberOfFile;
    entry.attr = statusOf(request, numberOfFile);
    entry.attr_timeout = forEver;
    entry.entry_timeout = forEver;
    ::fuse_reply_entry(request, &entry);
}

void tellStatus(fuse_req_t request, fuse_ino_t number, fuse_file_info*)
{
    const struct stat status = statusOf(request, number);
    ::fuse_reply_attr(request, &status, forEver);
}

// Its times may be set, which means nothing; its length is the disk's.
void changeStatus(fuse_req_t request, fuse_ino_t number, struct stat* wanted, int which,
                  fuse_file_info* file)
{
    const bool isResized =
        (which & FUSE_SET_ATTR_SIZE) != 0 && wanted->st_size != statusOf(request, number).st_size;
    if (isResized)
        ::fuse_reply_err(request, EPERM);
    else
        tellStatus(request, number, file);
}

void open(fuse_req_t request, fuse_ino_t, fuse_file_info* file)
{
    file->keep_cache = 1;
    ::fuse_reply_open(request, file);
}

// A place that cannot be read fails the whole request; the kernel asks again page by page. Fewer
// bytes would be taken for the end of the file.
void read(fuse_req_t request, fuse_ino_t, std::size_t bytes, off_t start, fuse_file_info*)
{
    thread_local std::vector<std::uint8_t> buffer(largestRequest);
    Overlay& overlay = overlayOf(request);
    const auto from = std::min(static_cast<std::uint64_t>(start), overlay.bytes());
    const auto count = static_cast<std::size_t>(
        std::min<std::uint64_t>({bytes, buffer.size(), overlay.bytes() - from}));
    if (const int error = overlay.read(from, {buffer.data(), count}))
        ::fuse_reply_err(request, error);
    else
        ::fuse_reply_buf(request, reinterpret_cast<const char*>(buffer.data()), count);
}

void write(fuse_req_t request, fuse_ino_t, const char* bytes, std::size_t count, off_t start,
           fuse_file_info*)
{
    const auto* const first = reinterpret_cast<const std::uint8_t*>(bytes);
    if (const int error =
            overlayOf(request).write(static_cast<std::uint64_t>(start), {first, count}))
        ::fuse_reply_err(request, error);
    else
        ::fuse_reply_write(request, count);
}

// Nothing of it outlives this process, so there is nothing to be brought to the medium.
void sync(fuse_req_t request, fuse_ino_t, int, fuse_file_info*)
{
    ::fuse_reply_err(request, 0);
}

/// There is no `flush`, which the kernel then never asks for: closing a descriptor must not wait
/// for this thread, which may be ending with the process.
fuse_lowlevel_ops operations()
{
    fuse_lowlevel_ops table = {};
    table.init = [](void*, fuse_conn_info* connection) {
        connection->max_write = largestRequest;
        connection->max_readahead = largestRequest;
    };
    table.lookup = look;
    table.getattr = tellStatus;
    table.setattr = changeStatus;
    table.open = open;
    table.read = read;
    table.write = write;
    table.fsync = sync;
    return table;
}

}  // namespace

/// What the thread serves, until it is told to end or nobody has the file open any more.
class OverlayFile::Server {
public:
    /// Null, and errno, when there is no memory or no descriptor for it.
    static std::unique_ptr<Server> make(Overlay& overlay, FuseMount mount)
    {
        static std::string program = "pellar";
        char* arguments[]{program.data(), nullptr};
        fuse_args list = FUSE_ARGS_INIT(1, arguments);
        static const fuse_lowlevel_ops table = operations();
        ::fuse_set_log_func([](fuse_log_level, const char*, va_list) {});
        fuse_session* const session = ::fuse_session_new(&list, &table, sizeof table, &overlay);
        ::fuse_opt_free_args(&list);  // the session adds to them, and keeps none
        if (session == nullptr)
            return nullptr;
        auto server = std::unique_ptr<Server>(new Server(session, std::move(mount)));
        return server->isReady() ? std::move(server) : nullptr;
    }

    Server(const Server&) = delete;
    Server& operator=(const Server&) = delete;
    ~Server()
    {
        ::fuse_session_destroy(session_);
        std::free(buffer_.mem);
    }

    int root() const { return root_.get(); }

    void serve()
    {
        pollfd waited[]{{::fuse_session_fd(session_), POLLIN, 0}, {end_.get(), POLLIN, 0}};
        while (::fuse_session_exited(session_) == 0) {
            if (::poll(waited, 2, -1) < 0)
                continue;  // interrupted
            if (waited[1].revents != 0)
                return;
            const int count = ::fuse_session_receive_buf(session_, &buffer_);
            if (count > 0)
                ::fuse_session_process_buf(session_, &buffer_);
            else if (count != -EINTR && count != -EAGAIN)
                return;
        }
    }

    void askToEnd() { ::eventfd_write(end_.get(), 1); }

private:
    Server(fuse_session* session, FuseMount mount)
        : session_(session), root_(std::move(mount.root)), end_(::eventfd(0, EFD_CLOEXEC))
    {
        // The session takes a copy of the number, and closes it.
        const FileDescriptor& channel = mount.channel;
        isReady_ = end_ && ::fuse_session_mount(
                               session_, ("/dev/fd/" + std::to_string(channel.get())).c_str()) == 0;
        if (isReady_)
            static_cast<void>(mount.channel.release());
    }

    bool isReady() const { return isReady_; }

    fuse_session* session_;
    FileDescriptor root_;
    FileDescriptor end_;
    fuse_buf buffer_{};
    bool isReady_ = false;
};

OverlayFile::OverlayFile(std::unique_ptr<Server> server) : server_(std::move(server))
{
    const SignalsBlocked blocked;  // the thread inherits it
    thread_ = std::thread([this] { server_->serve(); });
}

OverlayFile::~OverlayFile()
{
    file_.reset();
    server_->askToEnd();
    thread_.join();
}

Result<std::unique_ptr<OverlayFile>, int> OverlayFile::present(Overlay& overlay)
{
    auto mount = mountDetached();
    if (!mount)
        return mount.error();
    auto server = Server::make(overlay, *std::move(mount));
    if (!server)
        return errno;
    const int root = server->root();
    std::unique_ptr<OverlayFile> file(new OverlayFile(std::move(server)));
    file->file_ = FileDescriptor(::openat(root, nameOfFile, O_RDWR | O_CLOEXEC));
    if (!file->file_)
        return errno;
    return file;
}

}  // namespace pellar
