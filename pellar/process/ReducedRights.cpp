// SPDX-License-Identifier: Apache-2.0
#include "pellar/process/ReducedRights.h"

#include <fcntl.h>
#include <grp.h>
#include <linux/landlock.h>
#include <sys/prctl.h>
#include <sys/resource.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <csignal>

namespace pellar {
namespace {

bool limit(__rlimit_resource resource, unsigned long most) noexcept
{
    rlimit now = {};
    if (::getrlimit(resource, &now) != 0)
        return false;
    now.rlim_max = now.rlim_max < most ? now.rlim_max : most;
    now.rlim_cur = now.rlim_cur < now.rlim_max ? now.rlim_cur : now.rlim_max;
    return ::setrlimit(resource, &now) == 0;
}

bool becomeNobody() noexcept
{
    return ::geteuid() != 0 || (::setgroups(0, nullptr) == 0 &&
                                ::setresgid(groupOfReduced, groupOfReduced, groupOfReduced) == 0 &&
                                ::setresuid(userOfReduced, userOfReduced, userOfReduced) == 0);
}

}  // namespace

// The signal at the parent's death comes last: the kernel forgets it when the user changes
// (prctl(2)).
bool reduceRights(const ReducedLimits& limits) noexcept
{
    return limit(RLIMIT_AS, limits.addressSpace) && limit(RLIMIT_CPU, limits.processorTime) &&
           limit(RLIMIT_FSIZE, limits.fileBytes) && limit(RLIMIT_NOFILE, limits.descriptors) &&
           limit(RLIMIT_CORE, 0) && becomeNobody() && ::prctl(PR_SET_DUMPABLE, 0) == 0 &&
           ::prctl(PR_SET_NO_NEW_PRIVS, 1, 0, 0, 0) == 0 && ::prctl(PR_SET_PDEATHSIG, SIGKILL) == 0;
}

FileDescriptor ruleForWritingBelow(const std::filesystem::path& directory)
{
    landlock_ruleset_attr handled = {};
    handled.handled_access_fs = LANDLOCK_ACCESS_FS_WRITE_FILE | LANDLOCK_ACCESS_FS_REMOVE_DIR |
                                LANDLOCK_ACCESS_FS_REMOVE_FILE | LANDLOCK_ACCESS_FS_MAKE_CHAR |
                                LANDLOCK_ACCESS_FS_MAKE_DIR | LANDLOCK_ACCESS_FS_MAKE_REG |
                                LANDLOCK_ACCESS_FS_MAKE_SOCK | LANDLOCK_ACCESS_FS_MAKE_FIFO |
                                LANDLOCK_ACCESS_FS_MAKE_BLOCK | LANDLOCK_ACCESS_FS_MAKE_SYM;
    // The first version's structure, which every later kernel takes as well.
    FileDescriptor rule(static_cast<int>(
        ::syscall(SYS_landlock_create_ruleset, &handled, sizeof handled.handled_access_fs, 0)));
    const FileDescriptor below(::open(directory.c_str(), O_PATH | O_DIRECTORY | O_CLOEXEC));
    landlock_path_beneath_attr allowed = {};
    allowed.allowed_access = handled.handled_access_fs;
    allowed.parent_fd = below.get();
    if (!rule || !below ||
        ::syscall(SYS_landlock_add_rule, rule.get(), LANDLOCK_RULE_PATH_BENEATH, &allowed, 0) != 0)
        return {};
    return rule;
}

bool obeyRule(int rule) noexcept
{
    return ::syscall(SYS_landlock_restrict_self, rule, 0) == 0;
}

}  // namespace pellar
