// SPDX-License-Identifier: Apache-2.0
#include "pellar/undo/PublicIndex.h"

#include "pellar/bytes/Bytes.h"
#include "pellar/process/TrustedPath.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <utility>

namespace pellar {
namespace {

namespace fs = std::filesystem;

// "." at its beginning keeps it out of every listing.
constexpr const char* unfinishedName = ".new";
constexpr mode_t readByAll = 0644;

// Another program's images may lie below /dev, too.
bool isForEverybody(const RecordedDisk& disk)
{
    const std::string& path = disk.path.native();
    return path.starts_with("/dev/") && !path.starts_with("/dev/shm/");
}

std::string publicTextOf(RecordFacts facts)
{
    facts.repair.disk.name.clear();
    facts.rangesDigest.clear();
    facts.beforeDigest.clear();
    facts.afterDigest.clear();
    return encodeFacts(facts);
}

/// Of all of the file, for writing: one that is only open for reading can ask about it, but can
/// neither have it nor prevent it (fcntl(2), F_OFD_GETLK).
struct flock writersLock()
{
    struct flock lock = {};
    lock.l_type = F_WRLCK;
    lock.l_whence = SEEK_SET;
    return lock;
}

bool isLockedByWriter(int file)
{
    struct flock lock = writersLock();
    lock.l_type = F_RDLCK;
    return ::fcntl(file, F_OFD_GETLK, &lock) == 0 && lock.l_type != F_UNLCK;
}

/// 0 or an errno. What is not this user's, or is searched by all already, stays as it is.
int letAllSearch(const fs::path& directory)
{
    constexpr mode_t searched = S_IXUSR | S_IXGRP | S_IXOTH;
    const auto trusted = openTrusted(directory);
    struct stat status = {};
    if (!trusted || ::fstat(trusted->get(), &status) != 0)
        return EACCES;
    if (status.st_uid != ::geteuid() || (status.st_mode & searched) == searched)
        return 0;
    const FileDescriptor opened(::openat(trusted->get(), ".", O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    return opened && ::fchmod(opened.get(), (status.st_mode & 07777) | searched) == 0 ? 0 : errno;
}

/// As it is in the directory; an errno when it is not one file of its owner's alone to change.
Result<FileDescriptor, int> openEntry(int directory, const std::string& name)
{
    FileDescriptor file(
        ::openat(directory, name.c_str(), O_RDONLY | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC));
    struct stat status = {};
    if (!file || ::fstat(file.get(), &status) != 0)
        return errno;
    if (!S_ISREG(status.st_mode) || !whyOthersCanChange(status).empty())
        return EPERM;
    return file;
}

std::optional<ListedRecord> recordIn(int directory, const std::string& name)
{
    const auto file = openEntry(directory, name);
    if (!file)
        return std::nullopt;
    // Asked before it is read: who ends in between leaves another file in its place.
    const bool isInUse = isLockedByWriter(file->get());
    const auto text = readWhole(*file, largestFacts);
    auto facts = text ? decodeFacts(*text) : std::nullopt;
    if (!facts)
        return std::nullopt;
    return ListedRecord{name, std::move(*facts), isInUse};
}

}  // namespace

Result<PublicIndex, std::string> PublicIndex::open(const fs::path& path,
                                                   std::shared_ptr<const StoreDirectory> records,
                                                   SyncFunction sync)
{
    auto directory = StoreDirectory::open(path, std::move(sync));
    if (!directory)
        return directory.error();
    if (::fchmod(directory->descriptor(), 0755) != 0)
        return std::string(::strerrordesc_np(errno));
    for (const fs::path& above : {path.parent_path(), path.parent_path().parent_path()})
        if (const int error = letAllSearch(above))
            return std::string(::strerrordesc_np(error));
    return PublicIndex(std::move(*directory), std::move(records));
}

Result<std::shared_ptr<const PublicIndex>, std::string> PublicIndex::openUnlessEmpty(
    const fs::path& path, std::shared_ptr<const StoreDirectory> records, SyncFunction sync)
{
    if (path.empty())
        return std::shared_ptr<const PublicIndex>();
    auto index = open(path, std::move(records), std::move(sync));
    if (!index)
        return index.error();
    return std::make_shared<const PublicIndex>(std::move(*index));
}

// The mode comes last: nobody else has it open before it is locked.
Result<FileDescriptor, int> PublicIndex::publish(const std::string& id,
                                                 const RecordFacts& facts) const
{
    if (!isForEverybody(facts.repair.disk))
        return FileDescriptor();
    const std::string text = publicTextOf(facts);
    // Not the index's own directory, which anybody could lock.
    const DirectoryLock guard(records_->descriptor());
    ::unlinkat(directory_.descriptor(), unfinishedName, 0);
    FileDescriptor file(::openat(directory_.descriptor(), unfinishedName,
                                 O_RDWR | O_CREAT | O_EXCL | O_NOFOLLOW | O_CLOEXEC, 0600));
    if (!file)
        return errno;
    struct flock lock = writersLock();
    if (facts.state != RecordState::Applied && ::fcntl(file.get(), F_OFD_SETLK, &lock) != 0)
        return errno;
    if (const int error = writeAll(
            file.get(), 0, {reinterpret_cast<const std::uint8_t*>(text.data()), text.size()}))
        return error;
    if (::fchmod(file.get(), readByAll) != 0)
        return errno;
    if (const int error = directory_.sync(file.get()))
        return error;
    if (::renameat(directory_.descriptor(), unfinishedName, directory_.descriptor(), id.c_str()) !=
        0)
        return errno;
    if (const int error = directory_.sync())
        return error;
    return file;
}

bool PublicIndex::holds(const std::string& id, std::string_view text) const
{
    const auto file = openEntry(directory_.descriptor(), id);
    if (!file)
        return false;
    const auto found = readWhole(*file, largestFacts);
    return found && *found == text;
}

void PublicIndex::mend(const std::string& id, const RecordFacts& facts) const
{
    if (isForEverybody(facts.repair.disk) && !holds(id, publicTextOf(facts)))
        static_cast<void>(publish(id, facts));
}

int PublicIndex::remove(const std::string& id) const
{
    const DirectoryLock guard(records_->descriptor());
    if (::unlinkat(directory_.descriptor(), id.c_str(), 0) != 0)
        return errno == ENOENT ? 0 : errno;
    return directory_.sync();
}

// Under the lock: who makes a record has made its directory before its file is written here.
void PublicIndex::removeOrphans() const
{
    for (const std::string& id : directory_.names()) {
        const DirectoryLock guard(records_->descriptor());
        struct stat status = {};
        const bool isGone =
            ::fstatat(records_->descriptor(), id.c_str(), &status, AT_SYMLINK_NOFOLLOW) != 0 &&
            errno == ENOENT;
        if (isGone && ::unlinkat(directory_.descriptor(), id.c_str(), 0) == 0)
            static_cast<void>(directory_.sync());
    }
}

Result<RecordList, int> readPublicIndex(const fs::path& path)
{
    const auto directory = StoreDirectory::openExisting(path);
    if (!directory && directory.error() == ENOENT)
        return RecordList();
    if (!directory)
        return directory.error();
    RecordList list;
    for (const std::string& name : directory->names()) {
        if (auto record = recordIn(directory->descriptor(), name))
            list.records.push_back(std::move(*record));
        else
            list.broken.push_back(name);
    }
    sortNewestFirst(list.records, [](const ListedRecord& record) -> const RecordedRepair& {
        return record.facts.repair;
    });
    return list;
}

}  // namespace pellar
