// SPDX-License-Identifier: Apache-2.0
#include "pellar/packages/TemporaryDirectory.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <ctime>
#include <utility>
#include <vector>

namespace pellar {
namespace {

namespace fs = std::filesystem;

FileDescriptor openDirectory(const fs::path& path)
{
    return FileDescriptor(::open(path.c_str(), O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC));
}

// Who made it holds a lock on it for as long as it lives. One that is being made has none yet.
bool isLeftBehind(const fs::path& path)
{
    constexpr std::time_t secondsToLock = 60;
    const FileDescriptor directory = openDirectory(path);
    struct stat status = {};
    return directory && ::fstat(directory.get(), &status) == 0 && status.st_uid == ::geteuid() &&
           std::time(nullptr) - status.st_mtime > secondsToLock &&
           ::flock(directory.get(), LOCK_EX | LOCK_NB) == 0;
}

void removeLeftBehind(const fs::path& parent, const std::string& prefix)
{
    std::error_code error;
    std::vector<fs::path> found;
    for (const auto& entry : fs::directory_iterator(parent, error))
        if (entry.path().filename().native().starts_with(prefix))
            found.push_back(entry.path());
    for (const fs::path& path : found)
        if (isLeftBehind(path))
            fs::remove_all(path, error);
}

bool writeAll(int to, const char* bytes, std::size_t length, off_t place)
{
    while (length > 0) {
        const ssize_t count = ::pwrite(to, bytes, length, place);
        if (count < 0 && errno == EINTR)
            continue;
        if (count <= 0)
            return false;
        bytes += count;
        place += count;
        length -= static_cast<std::size_t>(count);
    }
    return true;
}

}  // namespace

std::optional<TemporaryDirectory> TemporaryDirectory::make(const std::string& purpose)
{
    std::error_code error;
    const fs::path parent = fs::temp_directory_path(error);
    if (error)
        return std::nullopt;
    const std::string prefix = "orvane-" + purpose + '.';
    removeLeftBehind(parent, prefix);
    std::string name = (parent / (prefix + "XXXXXX")).native();
    if (::mkdtemp(name.data()) == nullptr)
        return std::nullopt;
    TemporaryDirectory made(name, openDirectory(name));
    // Another user's program passes through it to its own below.
    if (!made.lock_ || ::flock(made.lock_.get(), LOCK_EX | LOCK_NB) != 0 ||
        ::chmod(name.c_str(), 0711) != 0 || ::mkdir(made.path().c_str(), 0700) != 0)
        return std::nullopt;
    return made;
}

TemporaryDirectory::TemporaryDirectory(TemporaryDirectory&& other) noexcept
    : outer_(std::exchange(other.outer_, {})), lock_(std::move(other.lock_))
{
}

TemporaryDirectory::~TemporaryDirectory()
{
    std::error_code error;
    if (!outer_.empty())
        fs::remove_all(outer_, error);
}

bool TemporaryDirectory::giveTo(uid_t user, gid_t group) const
{
    std::error_code error;
    bool isGiven = true;
    for (const auto& entry : fs::directory_iterator(path(), error))
        isGiven = ::lchown(entry.path().c_str(), user, group) == 0 && isGiven;
    return isGiven && !error && ::lchown(path().c_str(), user, group) == 0;
}

Copying copyFile(int from, int to, CopyBounds& bounds, const StopSwitch& stop)
{
    std::vector<char> buffer(1U << 20U);
    off_t place = 0;
    struct stat status = {};
    if (::fstat(from, &status) != 0)
        return Copying::Failed;
    const auto size = static_cast<std::uint64_t>(status.st_size);
    if (size > bounds.mostApparentBytes)
        return Copying::BeyondBounds;
    bounds.mostApparentBytes -= size;
    while (place < status.st_size) {
        const off_t data = ::lseek(from, place, SEEK_DATA);
        if (data < 0 && errno == ENXIO)
            break;  // nothing but a hole is left
        place = data < 0 ? place : data;
        const off_t hole = data < 0 ? status.st_size : ::lseek(from, place, SEEK_HOLE);
        const off_t end = std::min(hole < 0 ? status.st_size : hole, status.st_size);
        while (place < end) {
            const auto wanted =
                std::min<std::uint64_t>(buffer.size(), static_cast<std::uint64_t>(end - place));
            if (stop.isPressed())
                return Copying::Stopped;
            if (wanted > bounds.mostBytes)
                return Copying::BeyondBounds;
            const ssize_t count = ::pread(from, buffer.data(), wanted, place);
            if (count < 0 && errno == EINTR)
                continue;
            if (count <= 0 || !writeAll(to, buffer.data(), static_cast<std::size_t>(count), place))
                return Copying::Failed;
            place += count;
            bounds.mostBytes -= static_cast<std::uint64_t>(count);
        }
    }
    return ::ftruncate(to, status.st_size) == 0 ? Copying::Done : Copying::Failed;
}

}  // namespace pellar
