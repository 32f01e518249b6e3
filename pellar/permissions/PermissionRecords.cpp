// SPDX-License-Identifier: Apache-2.0
#include "pellar/permissions/PermissionRecords.h"

#include "pellar/bytes/Bytes.h"
#include "pellar/packages/RootDirectory.h"

#include <fcntl.h>
#include <sys/file.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstdio>
#include <system_error>

namespace pellar {
namespace {

// "." at its beginning keeps it out of every listing until it is whole.
constexpr const char* unfinishedName = ".new";
/// Some two million files.
constexpr std::size_t largestRecord = std::size_t{1} << 30U;

/// Sorts like the time.
std::string nameFor(std::chrono::system_clock::time_point time, int number)
{
    std::array<char, 64> text{};
    std::snprintf(text.data(), text.size(), "%012lld-%03d",
                  static_cast<long long>(std::chrono::system_clock::to_time_t(time)), number);
    return text.data();
}

int lock(const FileDescriptor& file, int kind)
{
    struct stat status = {};
    if (::flock(file.get(), kind | LOCK_NB) != 0 || ::fstat(file.get(), &status) != 0)
        return errno;
    return status.st_nlink > 0 ? 0 : ENOENT;  // removed by who had the lock before
}

bool isSameSystem(const PermissionsRun& a, const PermissionsRun& b)
{
    const RecordedDisk& disk = a.repair.disk;
    const RecordedDisk& other = b.repair.disk;
    if (disk.uuid != other.uuid)
        return false;
    return !disk.uuid.empty() || (disk.path == other.path && a.mountPoint == b.mountPoint);
}

/// What is said of it to everybody.
RecordFacts factsOf(const PermissionsRun& run)
{
    RecordFacts facts;
    facts.repair = run.repair;
    facts.state = RecordState::Applied;
    return facts;
}

std::uint64_t unsettledIn(const std::vector<RecordedChange>& changes)
{
    return static_cast<std::uint64_t>(std::ranges::count_if(
        changes,
        [](const RecordedChange& change) { return change.stage != ChangeStage::Settled; }));
}

}  // namespace

const ListedPermissionRecord* newestOf(const PermissionsRun& system,
                                       const PermissionRecordList& list)
{
    const auto found = std::ranges::find_if(
        list.records,
        [&](const ListedPermissionRecord& record) { return isSameSystem(record.run, system); });
    return found == list.records.end() ? nullptr : &*found;
}

int PermissionRecord::append(const std::string& text)
{
    const int error = writeAll(file_.get(), length_,
                               {reinterpret_cast<const std::uint8_t*>(text.data()), text.size()});
    if (error == 0)
        length_ += text.size();
    return error;
}

int PermissionRecord::begin(const PermissionsRun& run)
{
    run_ = run;
    const int error = append(lineOfRun(run));
    return error != 0 ? error : sync();
}

bool PermissionRecord::read()
{
    const auto text = contentsOf(file_.get(), largestRecord);
    auto decoded = text ? decodeRecord(*text) : std::nullopt;
    if (!decoded)
        return false;
    run_ = std::move(decoded->run);
    changes_ = std::move(decoded->changes);
    damagedLines_ = decoded->damagedLines;
    length_ = text->rfind('\n') + 1;  // what is appended overwrites a line that was cut off
    return true;
}

int PermissionRecord::add(const std::vector<RecordedChange>& changes)
{
    std::string text;
    std::uint64_t number = changes_.size();
    for (const RecordedChange& change : changes)
        text += lineOfChange(number++, change);
    const std::uint64_t before = length_;
    int error = append(text);
    if (error == 0)
        error = sync();
    if (error != 0) {
        length_ = before;
        static_cast<void>(!::ftruncate(file_.get(), static_cast<off_t>(before)));
        return error;
    }
    changes_.insert(changes_.end(), changes.begin(), changes.end());
    return 0;
}

int PermissionRecord::note(std::size_t change, ChangeStage stage,
                           const std::optional<FileState>& after)
{
    RecordedChange& noted = changes_.at(change);
    noted.stage = stage;
    if (after)
        noted.after = after;
    return append(lineOfStage(change, stage, after));
}

int PermissionRecord::sync() const
{
    return directory_->sync(file_.get());
}

int PermissionRecord::remove() const
{
    if (::unlinkat(directory_->descriptor(), name_.c_str(), 0) != 0)
        return errno;
    const int error = directory_->sync();
    return error == 0 && index_ ? index_->remove(name_) : error;
}

Result<PermissionRecords, Sentence> PermissionRecords::open(const std::filesystem::path& directory,
                                                            SyncFunction sync,
                                                            const std::filesystem::path& index)
{
    const auto without = [](const std::string& reason) {
        return Sentence{
            "there is no directory to keep the permissions in that a repair changes: %1$@",
            reason,
            {}};
    };
    auto opened = StoreDirectory::open(directory, sync);
    if (!opened)
        return without(opened.error());
    const auto records = std::make_shared<const StoreDirectory>(std::move(*opened));
    const auto published = PublicIndex::openUnlessEmpty(index, records, std::move(sync));
    if (!published)
        return without(published.error());
    return PermissionRecords(records, *published);
}

Result<PermissionRecord, int> PermissionRecords::begin(const PermissionsRun& run) const
{
    const int directory = directory_->descriptor();
    const DirectoryLock guard(directory);
    ::unlinkat(directory, unfinishedName, 0);
    FileDescriptor file(::openat(directory, unfinishedName,
                                 O_RDWR | O_CREAT | O_EXCL | O_NOFOLLOW | O_CLOEXEC, 0600));
    if (!file)
        return errno;
    PermissionRecord record(directory_, index_, unfinishedName, std::move(file));
    int error = lock(record.file_, LOCK_EX);
    if (error == 0)
        error = record.begin(run);
    constexpr int mostTries = 999;
    for (int i = 1; error == 0 && record.name_ == unfinishedName; ++i) {
        const std::string name = nameFor(run.repair.time, i);
        if (::renameat2(directory, unfinishedName, directory, name.c_str(), RENAME_NOREPLACE) == 0)
            record.name_ = name;
        else if (errno != EEXIST || i == mostTries)
            error = errno;
    }
    if (error == 0)
        error = directory_->sync();
    if (error == 0)
        error = publish(record);
    if (error == 0)
        return record;
    ::unlinkat(directory, record.name_.c_str(), 0);
    return error;
}

int PermissionRecords::publish(const PermissionRecord& record) const
{
    if (!index_)
        return 0;
    const auto shown = index_->publish(record.name_, factsOf(record.run_));
    return shown ? 0 : shown.error();
}

// O_NONBLOCK: a FIFO in a file's place must not keep the process waiting; it is refused.
Result<PermissionRecord, int> PermissionRecords::openLocked(const std::string& name, int kind) const
{
    if (name.empty() || name.front() == '.' || name.find('/') != std::string::npos)
        return ENOENT;
    FileDescriptor file(::openat(directory_->descriptor(), name.c_str(),
                                 O_RDWR | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC));
    struct stat status = {};
    if (!file || ::fstat(file.get(), &status) != 0)
        return errno;
    if (!S_ISREG(status.st_mode))
        return EINVAL;
    PermissionRecord record(directory_, index_, name, std::move(file));
    const int error = lock(record.file_, kind);
    // One that is in use may be read all the same: it is only appended to.
    if (error != 0 && !(kind == LOCK_SH && error == EWOULDBLOCK))
        return error;
    record.isInUse_ = error != 0;
    if (!record.read())
        return EBADMSG;
    return record;
}

PermissionRecordList PermissionRecords::list() const
{
    PermissionRecordList list;
    for (const std::string& name : directory_->names()) {
        const auto record = openLocked(name, LOCK_SH);
        if (record) {
            list.records.push_back(
                {name, record->run(), unsettledIn(record->changes()), record->isInUse_});
            if (index_ && !record->isInUse_)
                index_->mend(name, factsOf(record->run()));
        } else if (record.error() != ENOENT) {
            list.broken.push_back(name);
            if (index_ && record.error() != EWOULDBLOCK)
                static_cast<void>(index_->remove(name));
        }
    }
    if (index_)
        index_->removeOrphans();
    sortNewestFirst(list.records,
                    [](const ListedPermissionRecord& record) -> const RecordedRepair& {
                        return record.run.repair;
                    });
    return list;
}

Result<PermissionRecord, Sentence> PermissionRecords::take(const std::string& id) const
{
    auto record = waitingForLock([&] { return openLocked(id, LOCK_EX); });
    if (record)
        return std::move(*record);
    if (record.error() == EWOULDBLOCK)
        return Sentence{"what was kept of it is in use", {}, {}};
    return Sentence{"what was kept of it cannot be read: %1$@",
                    std::generic_category().message(record.error()),
                    {}};
}

void PermissionRecords::removeBeyond(const RecordLimits& limits,
                                     std::chrono::system_clock::time_point now) const
{
    const PermissionRecordList list = this->list();
    std::size_t left = list.records.size();
    for (auto listed = list.records.rbegin(); listed != list.records.rend(); ++listed) {
        const bool isBeyond = left > limits.records || now - listed->run.repair.time > limits.age;
        if (!isBeyond)
            continue;
        const auto record = openLocked(listed->id, LOCK_EX);
        if (record && record->remove() == 0)
            --left;
    }
}

}  // namespace pellar
