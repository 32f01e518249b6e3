// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/outcome/Result.h"
#include "pellar/undo/RecordDirectory.h"
#include "pellar/undo/RecordFacts.h"
#include "pellar/undo/Region.h"

#include <functional>
#include <optional>
#include <vector>

namespace pellar {

/// How the caller takes part in long work. Both may be empty.
struct UndoWork {
    /// Asked about once a mebibyte, until the first byte is written to the disk; from then on the
    /// work goes to its end.
    std::function<bool()> isStopped;
    /// Bytes that were dealt with, of all that are; each range counts once for each pass over it.
    std::function<void(std::uint64_t done, std::uint64_t total)> progress;
};

/// What went wrong in a pass over the ranges.
struct UndoFault {
    enum class Cause {
        Stopped,
        DiskChanged,     ///< it holds other bytes than the record tells
        DiskUnreadable,  ///< `error` is an errno, here and in all below but two
        DiskUnwritable,
        DiskForgetful,     ///< it reads back as other bytes than were written; no `error`
        ResultUnreadable,  ///< the bytes after, where they are read from
        RecordDamaged,     ///< its bytes do not have their digests; no `error`
        RecordFailed,      ///< its files cannot be read or written
    };

    Cause cause;
    int error = 0;
};

/// Goes over all ranges of a record in pieces of a mebibyte at most, between the disk and the
/// record's files. All arguments of the constructor outlive it.
class RangePasses {
public:
    enum class Expected {
        Before,   ///< the disk has the bytes before
        Mixture,  ///< each byte is as before or as after: writing was interrupted, at any byte
    };
    enum class Writing { Everything, WhatDiffers };
    struct Digests {
        std::string before;
        std::string after;
    };

    /// `count` of the passes that there will be, for the progress.
    RangePasses(const RecordDirectory& directory, const std::vector<ByteRange>& ranges,
                const UndoWork& work, unsigned count);

    /// Makes the files of the bytes before and after; they are on the medium, their names not yet.
    [[nodiscard]] Result<Digests, UndoFault> save(RegionReader& before, RegionReader& after);
    /// Whether the disk holds what is expected, and the record's files have their digests.
    [[nodiscard]] std::optional<UndoFault> compare(RegionReader& disk, const Digests& digests,
                                                   Expected expected);
    /// Makes the file of the bytes after anew from the disk, if they have their digest there; that
    /// of the bytes before is checked as well.
    [[nodiscard]] std::optional<UndoFault> saveAfterFrom(RegionReader& disk,
                                                         const Digests& digests);
    /// Writes a file of the record to the disk, syncs it, and compares what the medium then
    /// answers. The first fault ends it, but where only what differs is written: there everything
    /// that can be written is.
    [[nodiscard]] std::optional<UndoFault> write(Region& disk, const char* name, Writing writing);

private:
    struct Piece;
    bool isShortened(const RegionReader& disk) const;
    template <class Deal>
    std::optional<UndoFault> forEachPiece(Deal&& deal);
    std::optional<UndoFault> writePieces(Region& disk, const FileDescriptor& file);
    std::optional<UndoFault> writeDifferingPieces(Region& disk, const FileDescriptor& file);
    std::optional<UndoFault> readBack(RegionReader& disk, const FileDescriptor& file);

    const RecordDirectory& directory_;
    const std::vector<ByteRange>& ranges_;
    const UndoWork& work_;
    std::uint64_t done_ = 0;
    std::uint64_t total_ = 0;
    bool mayStop_ = true;
};

}  // namespace pellar
