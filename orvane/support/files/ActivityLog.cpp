// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/files/ActivityLog.h"

#include "contract/foundation/UTF8.h"
#include "orvane/support/files/WholeFile.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstdint>
#include <cstring>
#include <utility>

namespace orvane {
namespace {

bool isPlain(unsigned char c)
{
    return c >= 0x20 && c < 0x7F;
}

// Whether all of eight bytes lie in 0x20..0x7E: adding 0x60 to a byte below 0x80 sets its top bit
// exactly from 0x20 on, and adding 1 sets it for 0x7F alone.
bool isPlain(std::uint64_t eight)
{
    constexpr std::uint64_t tops = 0x8080808080808080U;
    constexpr std::uint64_t ones = 0x0101010101010101U;
    const std::uint64_t low = eight & ~tops;
    return (eight & tops) == 0 && ((low + 0x60 * ones) & tops) == tops &&
           ((low + ones) & tops) == 0;
}

bool isPlain(std::string_view text)
{
    for (; text.size() >= sizeof(std::uint64_t); text.remove_prefix(sizeof(std::uint64_t))) {
        std::uint64_t eight = 0;
        std::memcpy(&eight, text.data(), sizeof eight);
        if (!isPlain(eight))
            return false;
    }
    return std::all_of(text.begin(), text.end(),
                       [](char c) { return isPlain(static_cast<unsigned char>(c)); });
}

}  // namespace

void appendLogText(std::string& log, std::string_view text)
{
    while (!text.empty()) {
        const std::size_t length = std::min(text.find('\n'), text.size());
        const std::string_view line = text.substr(0, length);
        if (isPlain(line))
            log += line;
        else
            log += contract::printable(line);
        text.remove_prefix(length);
        if (!text.empty()) {
            log += '\n';
            text.remove_prefix(1);
        }
    }
}

std::string_view LogClock::now()
{
    std::timespec time = {};
    ::clock_gettime(CLOCK_REALTIME_COARSE, &time);
    if (time.tv_sec != second_) {
        second_ = time.tv_sec;
        std::tm local = {};
        ::localtime_r(&second_, &local);
        std::array<char, 32> text;
        text_.assign(text.data(),
                     std::strftime(text.data(), text.size(), "%Y-%m-%d %H:%M:%S ", &local));
    }
    return text_;
}

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

// Another program may have rotated the log, or a user removed it.
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
    if (!createPrivateDirectory(file_.parent_path()))
        return ENOENT;
    // A link or a FIFO in the log's place is refused, not written to.
    const int flags = O_WRONLY | O_APPEND | O_CREAT | O_CLOEXEC | O_NOFOLLOW | O_NONBLOCK;
    descriptor_ = pellar::FileDescriptor(::open(file_.c_str(), flags, 0600));
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

namespace {

// The second level has errors, and what is worth a note besides, as that a module was loaded.
std::string_view nameOf(int level)
{
    switch (level) {
        case contract::OVLog::mismatch: return "mismatch ";
        case contract::OVLog::error: return "notice ";
        default: return "trace ";
    }
}

}  // namespace

ActivityLog::ActivityLog(const Options& options, const WarningSink& warn)
    : keptLevel_(options.keptLevel),
      shownLevel_(options.shownLevel),
      developers_(fileIn(options.directory, "fixwell.log"), options.limits, warn),
      activity_(fileIn(options.directory, "activity.log"), options.limits, warn)
{
}

bool ActivityLog::keepsLevel(int level) const
{
    return level <= std::max(keptLevel_, shownLevel_);
}

void ActivityLog::ov_log(int level, int /*flags*/, std::string_view line)
{
    if (!keepsLevel(level))
        return;
    while (line.ends_with('\n'))
        line.remove_suffix(1);
    std::string text(nameOf(level));
    appendLogText(text, line);
    text += '\n';
    if (level <= keptLevel_) {
        developers_.buffer().append(clock_.now()).append(text);
        developers_.flush();
    }
    // Standard error may be closed; there is no other place to say it.
    if (level <= shownLevel_)
        static_cast<void>(writeAll(STDERR_FILENO, text));
}

void ActivityLog::log(std::string_view text)
{
    if (!isAtLineStart_)
        logPriorityWithEOL({}, 0, true);
    while (text.ends_with(' '))
        text.remove_suffix(1);
    logPriorityWithEOL(text, 0, !text.ends_with('\n'));
}

void ActivityLog::logPriorityWithEOL(std::string_view text, int /*priority*/, bool addsEndOfLine)
{
    std::string& buffer = activity_.buffer();
    const bool isBlank = text.empty() || text.front() == '\n';
    if (isAtLineStart_ && !isBlank)
        buffer += clock_.now();
    appendLogText(buffer, text);
    if (addsEndOfLine)
        buffer += '\n';
    if (!text.empty() || addsEndOfLine)
        isAtLineStart_ = addsEndOfLine || text.back() == '\n';
    activity_.flushWhenFull();
}

void ActivityLog::flush()
{
    activity_.flush();
}

}  // namespace orvane
