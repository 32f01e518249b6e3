// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/outcome/Result.h"
#include "pellar/texts/Sentence.h"
#include "pellar/undo/UndoRecord.h"

#include <unistd.h>

#include <chrono>
#include <filesystem>
#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace pellar {

/// A record as a list shows it.
struct ListedRecord {
    std::string id;
    RecordFacts facts;
    bool isInUse = false;  ///< a process works on it

    /// Its disk is partly as before and partly as after, and nobody is working on that.
    bool isInterrupted() const { return !isInUse && facts.state != RecordState::Applied; }
};

struct RecordList {
    std::vector<ListedRecord> records;  ///< the newest first
    /// Of directories that hold no record to be trusted: a file is missing, cut off or altered.
    std::vector<std::string> broken;
};

/// The newest of this disk: at the same place of the same path; or with the same UUID and length
/// where that path is no longer there. Null when there is none. Looks whether paths exist.
[[nodiscard]] const ListedRecord* newestOf(const RecordedDisk& disk, const RecordList& list);

/// What may be kept.
struct RecordLimits {
    std::size_t records = 0;
    std::chrono::hours age{};
    std::uint64_t bytes = 0;  ///< of the bytes before, all records together
};

/// The records of a system, or of a user. They are safe on the medium in such an order that after a
/// power cut each is whole or, where it was never applied, not there. Several processes may use one
/// store. Any thread, one at a time for each record.
class UndoStore {
public:
    /// Makes the directory when it is missing. It must be absolute, and no other user but root may
    /// be able to change it.
    /// `index` is where everybody may read which records there are (PublicIndex); nowhere when it
    /// is empty. Where that cannot be made, nothing more is saved; what is there can be undone.
    [[nodiscard]] static Result<UndoStore, Sentence> open(const std::filesystem::path& directory,
                                                          SyncFunction sync = ::fsync,
                                                          const std::filesystem::path& index = {});

    /// Reads the ranges (`areInOrder` within the disk's length) from the disk and from the view of
    /// it repaired, and keeps both, ready to be applied.
    [[nodiscard]] Result<UndoRecord, Sentence> save(const RecordedRepair& repair,
                                                    std::vector<ByteRange> ranges,
                                                    RegionReader& before, RegionReader& after,
                                                    const UndoWork& work = {}) const;

    /// Also removes what was never committed and is not being worked on, and mends the index.
    [[nodiscard]] RecordList list() const;
    /// A record to be undone or finished. Waits for its lock, a fifth of a second at most.
    [[nodiscard]] Result<UndoRecord, Sentence> take(const std::string& id) const;
    /// Also a broken or an interrupted one, which can then be neither undone nor finished.
    [[nodiscard]] Result<void, Sentence> remove(const std::string& id) const;
    /// Removes the oldest records, but none that is interrupted or in use, until what is left keeps
    /// to the limits. Answers how many.
    std::size_t removeBeyond(const RecordLimits& limits,
                             std::chrono::system_clock::time_point now) const;

private:
    UndoStore(std::shared_ptr<const StoreDirectory> directory,
              std::shared_ptr<const PublicIndex> index)
        : directory_(std::move(directory)), index_(std::move(index))
    {
    }

    [[nodiscard]] Result<RecordDirectory, Sentence> openLocked(const std::string& id) const;

    [[nodiscard]] int remove(const RecordDirectory& directory) const;
    void mendIndex(const ListedRecord& record) const;

    std::shared_ptr<const StoreDirectory> directory_;
    std::shared_ptr<const PublicIndex> index_;  ///< null where there is none
    std::string whyNoIndex_;                    ///< in English, where there ought to be one
};

}  // namespace pellar
