// SPDX-License-Identifier: Apache-2.0
#include "pellar/process/ReducedRights.h"

#include <grp.h>
#include <sys/prctl.h>
#include <sys/resource.h>
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

}  // namespace pellar
