// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/outcome/Result.h"
#include "pellar/texts/Sentence.h"
#include "pellar/undo/RangePasses.h"
#include "pellar/undo/RecordDirectory.h"
#include "pellar/undo/RecordFacts.h"
#include "pellar/undo/Region.h"

#include <string>
#include <vector>

namespace pellar {

class PublicIndex;

/// Why work on a record failed.
struct UndoFailure {
    enum class Left {
        Unchanged,    ///< the disk is as it was
        Interrupted,  ///< the disk may be partly as before and partly as after; the record is kept
    };

    Sentence sentence;
    Left left = Left::Unchanged;
};

/// That nothing was changed, and why.
[[nodiscard]] Sentence unchangedBecause(UndoFault fault);

/// The bytes that a repair changes on a disk, from before and from after it, safe in files. What is
/// written to the disk can then be completed or taken back whenever it is interrupted, and undone
/// later.
///
/// The record is locked for as long as this object lives. Its work takes up to three buffers of a
/// mebibyte, and 32 bytes a range. One thread at a time; it blocks.
class UndoRecord {
public:
    UndoRecord(UndoRecord&& other) noexcept;
    UndoRecord& operator=(UndoRecord&&) = delete;
    /// Removes a record that was never applied: the disk was not touched.
    ~UndoRecord();

    const std::string& id() const { return directory_.name(); }
    const RecordFacts& facts() const { return facts_; }

    // The disk is the one that the facts tell, claimed by the caller and open for writing. Each of
    // these first looks whether the disk still holds what the record tells, and does not write to
    // one that does not.

    /// Writes the bytes after; of a record that was just saved, and once. If the disk does not take
    /// them, the bytes before are put back and the record is removed. When even that fails, the
    /// record stays and counts as interrupted.
    [[nodiscard]] Result<void, UndoFailure> apply(Region& disk, const UndoWork& work = {});
    /// Writes the bytes before, also after an interruption, and removes the record. Of several
    /// records of a disk only the newest may be undone. An Applied one first takes the bytes after
    /// anew from the disk, so that this can be interrupted too: the store needs the room.
    [[nodiscard]] Result<void, UndoFailure> undo(Region& disk, const UndoWork& work = {});
    /// Writes the bytes after once more; of a record that was interrupted, hence is not Applied.
    [[nodiscard]] Result<void, UndoFailure> finish(Region& disk, const UndoWork& work = {});

private:
    friend class UndoStore;

    enum class Stage { Uncommitted, Committed, Removed };

    /// `index` may be null.
    UndoRecord(RecordDirectory directory, std::shared_ptr<const PublicIndex> index,
               RecordFacts facts, std::vector<ByteRange> ranges, Stage stage)
        : directory_(std::move(directory)),
          index_(std::move(index)),
          facts_(std::move(facts)),
          ranges_(std::move(ranges)),
          stage_(stage)
    {
    }

    RangePasses::Digests digests() const { return {facts_.beforeDigest, facts_.afterDigest}; }
    [[nodiscard]] Result<void, UndoFailure> putBack(Region& disk, UndoFault fault,
                                                    RangePasses& passes);
    [[nodiscard]] Result<void, UndoFailure> complete();
    [[nodiscard]] int publish(RecordState state);
    [[nodiscard]] int commit(RecordState state);
    [[nodiscard]] int remove();

    RecordDirectory directory_;
    std::shared_ptr<const PublicIndex> index_;
    FileDescriptor shownInUse_;  ///< in the index
    RecordFacts facts_;
    std::vector<ByteRange> ranges_;
    Stage stage_;
};

}  // namespace pellar
