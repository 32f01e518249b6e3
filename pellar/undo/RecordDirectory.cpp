// SPDX-License-Identifier: Apache-2.0
#include "pellar/undo/RecordDirectory.h"

#include "pellar/bytes/Bytes.h"
#include "pellar/process/TrustedPath.h"

#include <dirent.h>
#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <cstdio>
#include <cstring>

namespace pellar {
namespace {

namespace fs = std::filesystem;

constexpr const char* unfinishedFactsName = "facts.new";
constexpr int directoryFlags = O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC;

std::string descriptionOf(int error)
{
    return ::strerrordesc_np(error);
}

/// Each directory that is made is on the medium, as a name in the one above it; 0, or errno.
int makeDirectories(const fs::path& path, const SyncFunction& sync)
{
    fs::path way;
    for (const fs::path& name : path) {
        const fs::path above = way;
        way /= name;
        if (::mkdir(way.c_str(), 0700) != 0) {
            if (errno != EEXIST)
                return errno;
            continue;
        }
        const FileDescriptor opened(::open(above.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
        if (!opened || sync(opened.get()) != 0)
            return errno;
    }
    return 0;
}

std::string numbered(const std::string& name, int number)
{
    std::array<char, 16> digits{};
    std::snprintf(digits.data(), digits.size(), "-%03d", number);
    return name + digits.data();
}

}  // namespace

Result<std::string, int> readWhole(const FileDescriptor& file, std::uint64_t most)
{
    struct stat status = {};
    if (::fstat(file.get(), &status) != 0)
        return errno;
    if (static_cast<std::uint64_t>(status.st_size) > most)
        return EFBIG;
    std::string text(static_cast<std::size_t>(status.st_size), '\0');
    if (const int error =
            readAll(file.get(), 0, {reinterpret_cast<std::uint8_t*>(text.data()), text.size()}))
        return error;
    return text;
}

Result<StoreDirectory, std::string> StoreDirectory::open(const fs::path& path, SyncFunction sync)
{
    if (!path.is_absolute())
        return std::string("its path is not absolute");
    if (const int error = makeDirectories(path, sync))
        return descriptionOf(error);
    auto trusted = openTrusted(path);
    if (!trusted)
        return trusted.error();
    // What openTrusted answers can be neither listed nor synced (open(2), O_PATH).
    FileDescriptor directory(::openat(trusted->get(), ".", directoryFlags));
    if (!directory)
        return descriptionOf(errno);
    return StoreDirectory(std::move(directory), std::move(sync));
}

Result<StoreDirectory, int> StoreDirectory::openExisting(const fs::path& path)
{
    FileDescriptor directory(::open(path.c_str(), directoryFlags));
    struct stat status = {};
    if (!directory || ::fstat(directory.get(), &status) != 0)
        return errno;
    if (!whyOthersCanChange(status).empty())
        return EPERM;
    return StoreDirectory(std::move(directory), ::fsync);
}

int StoreDirectory::sync(int descriptor) const
{
    return sync_(descriptor) == 0 ? 0 : errno;
}

std::vector<std::string> StoreDirectory::names() const
{
    std::vector<std::string> names;
    // A descriptor of its own, for its place in the listing.
    const int listed = ::openat(directory_.get(), ".", directoryFlags);
    DIR* const directory = listed < 0 ? nullptr : ::fdopendir(listed);
    if (directory == nullptr) {
        if (listed >= 0)
            ::close(listed);
        return names;
    }
    while (const dirent* const entry = ::readdir(directory))
        if (entry->d_name[0] != '.')
            names.emplace_back(entry->d_name);
    ::closedir(directory);
    return names;
}

Result<RecordDirectory, int> RecordDirectory::make(std::shared_ptr<const StoreDirectory> store,
                                                   const std::string& name)
{
    constexpr int mostTries = 999;
    for (int i = 1; i <= mostTries; ++i) {
        const std::string tried = numbered(name, i);
        if (::mkdirat(store->descriptor(), tried.c_str(), 0700) != 0) {
            if (errno != EEXIST)
                return errno;
            continue;
        }
        auto made = open(store, tried);
        const int error = made ? made->lock() : made.error();
        if (error == 0)
            return made;
        // Until it is locked it looks left over, and another process may be removing it.
        if (error != EWOULDBLOCK && error != ENOENT) {
            ::unlinkat(store->descriptor(), tried.c_str(), AT_REMOVEDIR);
            return error;
        }
    }
    return EEXIST;
}

Result<RecordDirectory, int> RecordDirectory::open(std::shared_ptr<const StoreDirectory> store,
                                                   const std::string& name)
{
    if (name.empty() || name.front() == '.' || name.find('/') != std::string::npos)
        return ENOENT;
    FileDescriptor directory(::openat(store->descriptor(), name.c_str(), directoryFlags));
    if (!directory)
        return errno;
    return RecordDirectory(std::move(store), name, std::move(directory));
}

bool RecordDirectory::isStillInPlace() const
{
    struct stat ours = {};
    struct stat named = {};
    return ::fstat(directory_.get(), &ours) == 0 &&
           ::fstatat(store_->descriptor(), name_.c_str(), &named, AT_SYMLINK_NOFOLLOW) == 0 &&
           ours.st_dev == named.st_dev && ours.st_ino == named.st_ino;
}

int RecordDirectory::lockAs(int kind) const
{
    if (::flock(directory_.get(), kind | LOCK_NB) != 0)
        return errno;
    return isStillInPlace() ? 0 : ENOENT;
}

int RecordDirectory::lock() const
{
    return lockAs(LOCK_EX);
}

int RecordDirectory::lockForReading() const
{
    return lockAs(LOCK_SH);
}

Result<FileDescriptor, int> RecordDirectory::makeFile(const char* name) const
{
    FileDescriptor file(::openat(directory_.get(), name,
                                 O_WRONLY | O_CREAT | O_EXCL | O_NOFOLLOW | O_CLOEXEC, 0600));
    if (!file)
        return errno;
    return file;
}

// O_NONBLOCK: a FIFO in a file's place must not keep the process waiting; it is refused.
Result<FileDescriptor, int> RecordDirectory::openFile(const char* name) const
{
    FileDescriptor file(
        ::openat(directory_.get(), name, O_RDONLY | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC));
    struct stat status = {};
    if (!file || ::fstat(file.get(), &status) != 0)
        return errno;
    if (!S_ISREG(status.st_mode))
        return EINVAL;
    return file;
}

bool RecordDirectory::hasFile(const char* name, std::uint64_t size) const
{
    struct stat status = {};
    return ::fstatat(directory_.get(), name, &status, AT_SYMLINK_NOFOLLOW) == 0 &&
           S_ISREG(status.st_mode) && static_cast<std::uint64_t>(status.st_size) == size;
}

Result<std::string, int> RecordDirectory::readFile(const char* name, std::uint64_t most) const
{
    const auto file = openFile(name);
    if (!file)
        return file.error();
    return readWhole(*file, most);
}

int RecordDirectory::writeFile(const char* name, std::string_view text) const
{
    auto file = makeFile(name);
    if (!file)
        return file.error();
    if (const int error = writeAll(
            file->get(), 0, {reinterpret_cast<const std::uint8_t*>(text.data()), text.size()}))
        return error;
    return sync(*file);
}

int RecordDirectory::replaceFacts(std::string_view text) const
{
    if (const int error = removeFile(unfinishedFactsName))
        return error;
    if (const int error = writeFile(unfinishedFactsName, text))
        return error;
    if (::renameat(directory_.get(), unfinishedFactsName, directory_.get(), factsName) != 0)
        return errno;
    return store_->sync(directory_.get());
}

int RecordDirectory::removeFile(const char* name) const
{
    return ::unlinkat(directory_.get(), name, 0) == 0 || errno == ENOENT ? 0 : errno;
}

int RecordDirectory::syncNames() const
{
    const int error = store_->sync(directory_.get());
    return error != 0 ? error : store_->sync();
}

int RecordDirectory::remove() const
{
    if (const int error = removeFile(factsName))
        return error;
    if (const int error = store_->sync(directory_.get()))
        return error;
    for (const char* const name : {unfinishedFactsName, rangesName, beforeName, afterName})
        if (const int error = removeFile(name))
            return error;
    if (::unlinkat(store_->descriptor(), name_.c_str(), AT_REMOVEDIR) != 0)
        return errno;
    return store_->sync();
}

}  // namespace pellar
