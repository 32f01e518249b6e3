// SPDX-License-Identifier: Apache-2.0
#include "pellar/disks/WriteMark.h"

#include "pellar/process/KernelFiles.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <sys/sysmacros.h>
#include <unistd.h>

#include <sstream>

namespace pellar {
namespace {

std::string textOf(const timespec& time)
{
    return std::to_string(time.tv_sec) + "." + std::to_string(time.tv_nsec);
}

/// "8 0 64 1 5 0 40 2 0 4 3 ...": the seventh and the fourteenth are the sectors that were written,
/// and discarded. The numbers of requests are no use: an fsync of ours counts as a write without
/// any.
std::string writesOf(dev_t device)
{
    std::istringstream numbers(readKernelFile("/sys/dev/block/" + std::to_string(major(device)) +
                                              ":" + std::to_string(minor(device)) + "/stat")
                                   .value_or(""));
    std::string result;
    std::string number;
    for (int i = 1; numbers >> number; ++i)
        if (i == 7 || i == 14)
            result += number + " ";
    return result;
}

}  // namespace

WriteMark WriteMark::of(int disk)
{
    WriteMark mark;
    struct stat status = {};
    ::fsync(disk);
    if (::fstat(disk, &status) != 0)
        return mark;
    mark.text_ = S_ISBLK(status.st_mode)
                     ? writesOf(status.st_rdev)
                     : std::to_string(status.st_size) + " " + textOf(status.st_mtim) + " " +
                           textOf(status.st_ctim);
    return mark;
}

}  // namespace pellar
