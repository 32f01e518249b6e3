// SPDX-License-Identifier: Apache-2.0
#include "pellar/packages/reader/ReaderProcess.h"

#include "pellar/packages/PackagedFile.h"
#include "pellar/packages/TextLines.h"
#include "pellar/packages/reader/ReaderMessages.h"
#include "pellar/packages/reader/ReferenceBytes.h"
#include "pellar/process/ChildProcess.h"
#include "pellar/process/ReducedRights.h"

#include <fcntl.h>
#include <poll.h>
#include <seccomp.h>
#include <sys/prctl.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cmath>
#include <cstring>
#include <exception>
#include <fstream>
#include <memory>
#include <optional>

namespace pellar {
namespace {

/// What a process may do that reads what strangers wrote: compute, use memory, and use the
/// descriptors that it has or is given. It can open no file, start no program, make no connection
/// and signal nobody. Made before the fork.
class ReaderRights {
public:
    /// None where the kernel or the library has no filter to give.
    [[nodiscard]] static std::optional<ReaderRights> prepare();

    /// To be called in the process that is to have no more than these, which has one thread. As
    /// root it becomes nobody. NO when any of it fails: then nothing may be read.
    [[nodiscard]] bool take() const noexcept;

private:
    struct ReleaseFilter {
        void operator()(void* filter) const { ::seccomp_release(filter); }
    };

    std::unique_ptr<void, ReleaseFilter> filter_;
    unsigned long addressSpace_ = 0;  ///< bytes
};

// What the reading of the largest system needs, beside the host's own pages that a fork takes
// along.
constexpr unsigned long mostMemory = 2UL << 30U;

constexpr int allowedCalls[] = {SCMP_SYS(read),
                                SCMP_SYS(pread64),
                                SCMP_SYS(readv),
                                SCMP_SYS(write),
                                SCMP_SYS(lseek),
                                SCMP_SYS(_llseek),
                                SCMP_SYS(close),
                                SCMP_SYS(fstat),
                                SCMP_SYS(fstat64),
                                SCMP_SYS(sendmsg),
                                SCMP_SYS(recvmsg),
                                SCMP_SYS(memfd_create),
                                SCMP_SYS(brk),
                                SCMP_SYS(mmap),
                                SCMP_SYS(mmap2),
                                SCMP_SYS(munmap),
                                SCMP_SYS(mremap),
                                SCMP_SYS(mprotect),
                                SCMP_SYS(madvise),
                                SCMP_SYS(futex),
                                SCMP_SYS(futex_time64),
                                SCMP_SYS(rt_sigreturn),
                                SCMP_SYS(rt_sigprocmask),
                                SCMP_SYS(sigaltstack),
                                SCMP_SYS(getpid),
                                SCMP_SYS(getppid),
                                SCMP_SYS(getrandom),
                                SCMP_SYS(clock_gettime),
                                SCMP_SYS(clock_gettime64),
                                SCMP_SYS(gettimeofday),
                                SCMP_SYS(sched_yield),
                                SCMP_SYS(exit),
                                SCMP_SYS(exit_group)};

bool allow(scmp_filter_ctx filter)
{
    bool isComplete = true;
    for (const int call : allowedCalls)
        isComplete = ::seccomp_rule_add(filter, SCMP_ACT_ALLOW, call, 0) == 0 && isComplete;
    // fstat(3) of today's glibc: the descriptor itself, by an empty path.
    const bool hasStatus =
        ::seccomp_rule_add(filter, SCMP_ACT_ALLOW, SCMP_SYS(newfstatat), 1,
                           SCMP_A3(SCMP_CMP_MASKED_EQ, AT_EMPTY_PATH, AT_EMPTY_PATH)) == 0;
    return isComplete && hasStatus;
}

// The first number of statm is the size of the whole address space, in pages (proc(5)).
unsigned long addressSpaceOfHost()
{
    unsigned long pages = 0;
    std::ifstream("/proc/self/statm") >> pages;
    return pages * static_cast<unsigned long>(::sysconf(_SC_PAGESIZE));
}

std::optional<ReaderRights> ReaderRights::prepare()
{
    ReaderRights rights;
    // What is not allowed fails with an error: a library that only tries must not die of it.
    rights.filter_.reset(::seccomp_init(SCMP_ACT_ERRNO(EPERM)));
    if (!rights.filter_ || !allow(rights.filter_.get()))
        return std::nullopt;
    rights.addressSpace_ = addressSpaceOfHost() + mostMemory;
    return rights;
}

bool ReaderRights::take() const noexcept
{
    ReducedLimits limits;
    limits.addressSpace = addressSpace_;
    return reduceRights(limits) && ::seccomp_load(filter_.get()) == 0;
}

using Answer = Result<References, Sentence>;

constexpr std::size_t largestResult = 512U << 20U;
constexpr int socketOfReader = 0;

const Sentence readerFailed{
    "the package database could not be read: reading it needs more than any "
    "system's does, or it is damaged",
    {},
    {}};
const Sentence readerRefused{
    "the package database cannot be read with reduced rights here", {}, {}};

// The child of a process with threads. Locks that another thread held at the fork stay held: the
// reading takes memory (fork(2) of glibc sees to that), its two ends of the socket, and nothing
// else that is shared.
void readAndAnswer(const PathAliases& aliases, const DpkgSources& has, const Reading& reading)
{
    BrokeredServices services(socketOfReader, aliases);
    DpkgSources sources;
    sources.kept = has.kept != nullptr ? &services : nullptr;
    if (has.fetch)
        sources.fetch = [&services](auto packages) {
            return services.fetch(packages);
        };
    const auto references = reading(
        services, sources, [&services](double percent) { return services.progress(percent); });
    const auto send = [](Question question, const std::vector<int>& descriptors) {
        const char kind = static_cast<char>(question);
        sendMessage(socketOfReader, {&kind, 1}, descriptors);
    };
    if (!references)
        return send(Question::Stopped, {});
    if (const FileDescriptor result = memoryFileOf(bytesOf(*references)))
        send(Question::Result, {result.get()});
}

constexpr int refusedRights = 2;

[[noreturn]] void becomeReader(int socket, pid_t parent, const ReaderRights& rights,
                               const ReaderServices& services, const Reading& reading) noexcept
{
    ::setpgid(0, 0);  // a terminal's Ctrl-C is for the host, which then ends this
    resetSignals();
    ::prctl(PR_SET_NAME, "pellar-reader");
    const bool isPlaced = ::dup2(socket, socketOfReader) == socketOfReader;
    ::syscall(SYS_close_range, socketOfReader + 1, ~0U, 0U);
    if (!isPlaced || !rights.take())
        ::_exit(refusedRights);
    if (::getppid() != parent)
        ::_exit(1);
    try {
        readAndAnswer(services.root.aliases(), services.sources, reading);
    } catch (const std::exception&) {
        ::_exit(1);  // no memory is left to it
    }
    ::_exit(0);
}

/// Ends and reaps.
class ReaderChild {
public:
    explicit ReaderChild(pid_t id) : id_(id) {}
    ReaderChild(const ReaderChild&) = delete;
    ReaderChild& operator=(const ReaderChild&) = delete;
    ~ReaderChild()
    {
        if (id_ > 0) {
            ::kill(id_, SIGKILL);
            reap();
        }
    }
    /// Waits for its end.
    int reap()
    {
        int status = 0;
        pid_t waited = 0;
        do
            waited = ::waitpid(id_, &status, 0);
        while (waited < 0 && errno == EINTR);
        id_ = 0;
        return waited < 0 || !WIFEXITED(status) ? -1 : WEXITSTATUS(status);
    }

private:
    pid_t id_;
};

/// A memory file of the other process, which may still write to it; so it is read once, and no
/// more of it than may be.
std::optional<std::string> memoryFileIn(const ReaderMessage& message, std::size_t largest)
{
    if (message.descriptors.size() != 1)
        return std::nullopt;
    const int file = message.descriptors.front().get();
    const bool isInMemory = ::fcntl(file, F_GET_SEALS) >= 0;
    return isInMemory ? contentsOf(file, largest) : std::nullopt;
}

/// The end of the socket that has rights. Nothing that comes from the other is believed.
class ReaderBroker {
public:
    ReaderBroker(int socket, const ReaderServices& services) : socket_(socket), services_(services)
    {
    }

    /// None for as long as it goes on.
    std::optional<Answer> serve(ReaderMessage message)
    {
        const std::string bytes =
            message.bytes.substr(std::min<std::size_t>(1, message.bytes.size()));
        const bool isText = bytes.find('\0') == std::string::npos;
        const auto question = static_cast<Question>(message.bytes.empty() ? -1 : message.bytes[0]);
        switch (question) {
            case Question::OpenFile:
                return answerFile(isText ? services_.root.openFile(bytes) : FileDescriptor());
            case Question::Names: return answerFile(isText ? namesIn(bytes) : FileDescriptor());
            case Question::OpenKept:
                return answerFile(kept() ? kept()->open(bytes) : FileDescriptor());
            case Question::Keep:
                if (const auto mtree = memoryFileIn(message, mostBytesOfMtree); mtree && kept())
                    kept()->keep(bytes, *mtree);
                return answer("-");
            case Question::Fetch: return fetch(bytes);
            case Question::Progress: return answer(isToGoOn(bytes) ? "1" : "0");
            case Question::Result: return result(message);
            case Question::Stopped: return Answer(Sentence{});
        }
        return Answer(readerFailed);
    }

    bool goesOn() const { return services_.progress(percent_); }

private:
    KeptReferences* kept() const { return services_.sources.kept; }

    std::optional<Answer> answer(std::string_view bytes, const std::vector<int>& descriptors = {})
    {
        return sendMessage(socket_, bytes, descriptors) ? std::nullopt
                                                        : std::optional<Answer>(readerFailed);
    }

    std::optional<Answer> answerFile(const FileDescriptor& file)
    {
        return answer("-", file ? std::vector<int>{file.get()} : std::vector<int>());
    }

    FileDescriptor namesIn(const std::string& directory) const
    {
        std::string list;
        for (const std::string& name : services_.root.names(directory))
            list += name + '\0';
        return memoryFileOf(list);
    }

    std::optional<Answer> fetch(std::string_view list)
    {
        std::vector<DpkgPackage> packages;
        forEachLine(list, [&packages](std::string_view line) {
            DpkgPackage package;
            package.name = takeWord(line);
            package.version = takeWord(line);
            package.architecture = takeWord(line);
            packages.push_back(std::move(package));
        });
        const bool isAllowed =
            services_.sources.fetch && packages.size() <= mostDescriptorsOfMessage &&
            std::all_of(packages.begin(), packages.end(),
                        [](const DpkgPackage& package) { return package.isAllowed(); });
        if (!isAllowed)
            return Answer(readerFailed);
        std::string isThere;
        std::vector<int> descriptors;
        const auto archives = services_.sources.fetch(packages);
        for (const FileDescriptor& archive : archives) {
            isThere += archive ? '1' : '0';
            if (archive)
                descriptors.push_back(archive.get());
        }
        return answer(isThere.empty() ? "-" : isThere, descriptors);
    }

    bool isToGoOn(std::string_view bytes)
    {
        double percent = 0;
        if (bytes.size() == sizeof percent)
            std::memcpy(&percent, bytes.data(), sizeof percent);
        if (std::isfinite(percent))
            percent_ = std::clamp(percent, percent_, 100.0);
        return goesOn();
    }

    static std::optional<Answer> result(const ReaderMessage& message)
    {
        const auto bytes = memoryFileIn(message, largestResult);
        auto references = bytes ? referencesIn(*bytes) : std::nullopt;
        return references ? Answer(*std::move(references)) : Answer(readerFailed);
    }

    int socket_;
    const ReaderServices& services_;
    double percent_ = 0;
};

/// NO when the switch was pressed, or the reader has said nothing for far too long.
enum class Turn { Speaks, Quiet, Stopped };
Turn waitForTurn(int socket, StopSwitch& stop)
{
    constexpr int tick = 200;
    pollfd waited[]{{socket, POLLIN, 0}, {stop.descriptor(), POLLIN, 0}};
    const int ready = ::poll(waited, 2, tick);
    if (stop.isPressed())
        return Turn::Stopped;
    return ready > 0 && waited[0].revents != 0 ? Turn::Speaks : Turn::Quiet;
}

Answer serve(int socket, ReaderChild& child, const ReaderServices& services, StopSwitch& stop)
{
    constexpr int mostQuietTicks = 5 * 60 * 60;  // an hour, as its processor time
    ReaderBroker broker(socket, services);
    for (int quiet = 0; quiet < mostQuietTicks; ++quiet) {
        const Turn turn = waitForTurn(socket, stop);
        if (turn == Turn::Stopped || (turn == Turn::Quiet && !broker.goesOn()))
            return Sentence{};
        if (turn == Turn::Quiet)
            continue;
        quiet = 0;
        auto message = receiveMessage(socket);
        if (!message)
            return child.reap() == refusedRights ? readerRefused : readerFailed;
        if (auto answer = broker.serve(*std::move(message)))
            return *std::move(answer);
    }
    return readerFailed;
}

}  // namespace

Answer readApart(const ReaderServices& services, StopSwitch& stop, const Reading& reading)
{
    const auto rights = ReaderRights::prepare();
    if (!rights)
        return readerRefused;
    int ends[2];
    if (::socketpair(AF_UNIX, SOCK_SEQPACKET | SOCK_CLOEXEC, 0, ends) != 0)
        return Sentence{"%1$@ could not be started: %2$@", "pellar-reader", std::strerror(errno)};
    const FileDescriptor ours(ends[0]);
    FileDescriptor theirs(ends[1]);
    const pid_t parent = ::getpid();
    const auto fork = [&] {
        const SignalsBlocked blocked;
        const pid_t id = ::fork();
        if (id == 0)
            becomeReader(theirs.get(), parent, *rights, services, reading);
        return id;
    };
    const pid_t id = fork();
    if (id < 0)
        return Sentence{"%1$@ could not be started: %2$@", "pellar-reader", std::strerror(errno)};
    ReaderChild child(id);
    theirs.reset();
    return serve(ours.get(), child, services, stop);
}

}  // namespace pellar
