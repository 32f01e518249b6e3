// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/log/RotatingFile.h"

#include "orvane/support/files/WholeFile.h"

#include <fcntl.h>
#include <sys/stat.h>

#include <cerrno>
#include <utility>

namespace orvane {

RotatingFile::RotatingFile(std::filesystem::path file, Limits limits, WarningSink warn)
    : file_(std::move(file)), limits_(limits), warn_(std::move(warn))
{
}

RotatingFile::~RotatingFile()
{
    flush();
}

void RotatingFile::flush()
{
    if (buffer_.empty())
        return;
    int error = 0;
    if (!file_.empty()) {
        error = makeReady();
        if (error == 0)
            error = writeAll(descriptor_.get(), buffer_);
    }
    buffer_.clear();
    if (error != 0 && !std::exchange(hasWarned_, true))
        warn_(cannot("write the log", file_.native(), error).message);
}

int RotatingFile::makeReady()
{
    if (!isStillTheFile())
        if (const int error = open())
            return error;
    struct stat status = {};
    if (::fstat(descriptor_.get(), &status) != 0)
        return errno;
    const auto size = static_cast<std::size_t>(status.st_size);
    if (size == 0 || size + buffer_.size() <= limits_.bytes)
        return 0;
    rotate();
    return open();
}

// Another program may have rotated the log, or somebody has removed it.
bool RotatingFile::isStillTheFile() const
{
    struct stat mine = {};
    struct stat named = {};
    return descriptor_ && ::fstat(descriptor_.get(), &mine) == 0 &&
           ::stat(file_.c_str(), &named) == 0 && mine.st_ino == named.st_ino &&
           mine.st_dev == named.st_dev;
}

int RotatingFile::open()
{
    if (failed(createPrivateDirectory(file_.parent_path())))
        return ENOENT;
    // A link or a FIFO that somebody has put in the log's place is refused, not written to.
    const int flags = O_WRONLY | O_APPEND | O_CREAT | O_CLOEXEC | O_NOFOLLOW | O_NONBLOCK;
    descriptor_ = FileDescriptor(::open(file_.c_str(), flags, 0600));
    return descriptor_ ? 0 : errno;
}

// The oldest is removed first: renaming one file over another makes ext4 bring the data to the
// disk at once (ext4(5), auto_da_alloc), which a log is not worth.
void RotatingFile::rotate()
{
    std::error_code ignored;
    std::filesystem::remove(oldFile(limits_.oldFiles), ignored);
    for (int number = limits_.oldFiles; number > 0; --number)
        std::filesystem::rename(oldFile(number - 1), oldFile(number), ignored);
}

std::filesystem::path RotatingFile::oldFile(int number) const
{
    if (number == 0)
        return file_;
    return file_.native() + "." + std::to_string(number);
}

}  // namespace orvane
