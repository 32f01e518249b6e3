// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/jobs/Job.h"
#include "pellar/permissions/PermissionRecords.h"
#include "pellar/permissions/Restoring.h"

#include <optional>
#include <vector>

namespace pellar {

/// What is kept of a repair of permissions on this system, now.
PermissionsRun permissionsRunOn(const contract::DiskReference& disk, const RootDirectory& root,
                                const JobContext& context);

/// Sets files right, many at a time, and keeps beforehand how they are, so that the repair can be
/// undone. Where that cannot be kept, nothing is changed. The references outlive it.
class RecordedRestoring {
public:
    RecordedRestoring(contract::DiskReferencePointer disk, const RootDirectory& root,
                      JobContext& context)
        : disk_(std::move(disk)), root_(root), context_(context)
    {
    }

    /// The file may be held, and not yet changed, until `carryOut`. The reference outlives that.
    void add(const Reference& reference, FoundFile file);
    /// Whether this very file is still to be changed, under another name.
    [[nodiscard]] bool isWaiting(const FoundFile& file) const;
    /// All that waits, or, once the user stops it, as much as was begun.
    void carryOut();
    /// Nothing is set right after it. Keeps the records within their limits.
    void finish();

    std::uint64_t restored() const { return restored_; }
    /// Why nothing more was changed from some file on; empty where that is not so.
    const Sentence& failure() const { return failure_; }

private:
    struct Waiting {
        const Reference* reference;
        FoundFile file;
    };

    bool isToBeRecorded() const;
    /// `failure` is set when that is not possible.
    void record(const std::vector<Waiting>& batch);
    void restoreRecorded(const std::vector<Waiting>& batch);
    [[nodiscard]] Restoring restoreOne(const Waiting& waiting);
    void tell(const Restoring& restoring, const std::string& path);
    void failWith(const Sentence& reason);

    const contract::DiskReferencePointer disk_;
    const RootDirectory& root_;
    JobContext& context_;
    JobLog& log_ = context_.log;
    std::vector<Waiting> waiting_;
    std::optional<PermissionRecord> record_;
    Sentence failure_;
    std::uint64_t restored_ = 0;
};

}  // namespace pellar
