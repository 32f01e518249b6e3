// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/outcome/Result.h"
#include "pellar/permissions/RecordedChange.h"
#include "pellar/texts/Sentence.h"
#include "pellar/undo/PublicIndex.h"
#include "pellar/undo/RecordDirectory.h"
#include "pellar/undo/UndoStore.h"

#include <unistd.h>

#include <chrono>
#include <filesystem>
#include <memory>
#include <string>
#include <vector>

namespace pellar {

/// The record of one repair of permissions, a file that is only appended to. Who has it holds its
/// lock (flock(2)), which the kernel gives back when the process ends, however it ends. All numbers
/// answered are 0 or errno. One thread at a time.
class PermissionRecord {
public:
    const std::string& id() const { return name_; }
    const PermissionsRun& run() const { return run_; }
    const std::vector<RecordedChange>& changes() const { return changes_; }
    /// Lines in the middle of it that cannot be read; the changes that they told of are not there.
    std::uint64_t damagedLines() const { return damagedLines_; }

    /// Adds files that are going to be changed. When it answers 0 all of it is on the medium, and
    /// they may be; else it is as before.
    [[nodiscard]] int add(const std::vector<RecordedChange>& changes);
    /// What has become of a change, which is known by its place; on the medium after the next
    /// `sync`. `after` is there when the stage is Changed.
    [[nodiscard]] int note(std::size_t change, ChangeStage stage,
                           const std::optional<FileState>& after = {});
    [[nodiscard]] int sync() const;
    [[nodiscard]] int remove() const;

private:
    friend class PermissionRecords;

    PermissionRecord(std::shared_ptr<const StoreDirectory> directory,
                     std::shared_ptr<const PublicIndex> index, std::string name,
                     FileDescriptor file)
        : directory_(std::move(directory)),
          index_(std::move(index)),
          name_(std::move(name)),
          file_(std::move(file))
    {
    }

    [[nodiscard]] int begin(const PermissionsRun& run);
    [[nodiscard]] bool read();
    [[nodiscard]] int append(const std::string& text);

    std::shared_ptr<const StoreDirectory> directory_;
    std::shared_ptr<const PublicIndex> index_;  ///< null where there is none
    std::string name_;
    FileDescriptor file_;
    std::uint64_t length_ = 0;  ///< of the whole lines
    PermissionsRun run_;
    std::vector<RecordedChange> changes_;
    std::uint64_t damagedLines_ = 0;
    bool isInUse_ = false;  ///< by another, who has the lock
};

/// A repair of permissions that can be undone, as a list shows it.
struct ListedPermissionRecord {
    std::string id;
    PermissionsRun run;           ///< the disk, the user, the time
    std::uint64_t fileCount = 0;  ///< whose permissions may be put back
    bool isInUse = false;         ///< a process works on it
};

struct PermissionRecordList {
    std::vector<ListedPermissionRecord> records;  ///< the newest first
    /// Names of files that are no record to be trusted.
    std::vector<std::string> broken;
};

/// The newest of this system: on the file system with the same UUID or, where none has one, on the
/// same disk at the same mount point. Null when there is none.
[[nodiscard]] const ListedPermissionRecord* newestOf(const PermissionsRun& system,
                                                     const PermissionRecordList& list);

/// The records of repairs of permissions. Several processes may use one store. Any thread.
class PermissionRecords {
public:
    /// Makes the directory when it is missing. It must be absolute, and no other user but root may
    /// be able to change it. `index` is where everybody may read which records there are
    /// (PublicIndex); nowhere when it is empty.
    [[nodiscard]] static Result<PermissionRecords, Sentence> open(
        const std::filesystem::path& directory, SyncFunction sync = ::fsync,
        const std::filesystem::path& index = {});

    /// A new one, on the medium; errno otherwise.
    [[nodiscard]] Result<PermissionRecord, int> begin(const PermissionsRun& run) const;
    /// Also mends the index.
    [[nodiscard]] PermissionRecordList list() const;
    /// To be undone. Waits for its lock, a fifth of a second at most.
    [[nodiscard]] Result<PermissionRecord, Sentence> take(const std::string& id) const;
    /// Removes the oldest, but none that is in use, until no more than `limits.records` are left
    /// and none is older than `limits.age`.
    void removeBeyond(const RecordLimits& limits, std::chrono::system_clock::time_point now) const;

private:
    PermissionRecords(std::shared_ptr<const StoreDirectory> directory,
                      std::shared_ptr<const PublicIndex> index)
        : directory_(std::move(directory)), index_(std::move(index))
    {
    }

    [[nodiscard]] int publish(const PermissionRecord& record) const;
    [[nodiscard]] Result<PermissionRecord, int> openLocked(const std::string& name, int kind) const;

    std::shared_ptr<const StoreDirectory> directory_;
    std::shared_ptr<const PublicIndex> index_;  ///< null where there is none
};

}  // namespace pellar
