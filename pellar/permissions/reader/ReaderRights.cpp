// SPDX-License-Identifier: Apache-2.0
#include "pellar/permissions/reader/ReaderRights.h"

#include "pellar/process/ReducedRights.h"

#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <fstream>

namespace pellar {
namespace {

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

}  // namespace

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

}  // namespace pellar
