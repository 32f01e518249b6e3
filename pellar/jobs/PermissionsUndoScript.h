// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/jobs/Job.h"
#include "pellar/permissions/PermissionRecords.h"
#include "pellar/permissions/TakingBack.h"

#include <optional>
#include <string>

namespace pellar {

/// Takes back the newest repair of permissions on a mounted system, by the record that was kept of
/// it: every file that is as the repair left it has again what it had before. What is stopped goes
/// on with the next undo. Needs root. The references outlive it.
class PermissionsUndoScript final : public Script {
public:
    PermissionsUndoScript(contract::DiskReferencePointer disk, JobContext context);

    void run() override;

private:
    /// A failure, or none.
    using Failure = std::optional<Outcome>;

    Failure carryOut();
    Failure objectionTo(const ListedPermissionRecord* record) const;
    Failure work(const RootDirectory& root, PermissionRecord& record);
    Failure end(PermissionRecord& record);
    void takeBackBatch(const RootDirectory& root, PermissionRecord& record,
                       const std::vector<std::size_t>& batch);
    void takeBackOne(const RootDirectory& root, PermissionRecord& record, std::size_t place,
                     const RecordedChange& change);
    /// Whether there is nothing more to be done about it.
    bool settles(const TakingBack& result, const std::string& path);
    bool settlesUnseen(Unseen unseen, const std::string& path);
    Sentence numbers() const;
    void report(const Failure& failure);

    const contract::DiskReferencePointer disk_;
    JobContext context_;
    JobLog& log_ = context_.log;
    std::uint64_t putBack_ = 0;
    std::uint64_t leftAlone_ = 0;
    std::uint64_t asBefore_ = 0;
    std::uint64_t kept_ = 0;  ///< of those left alone: for the next undo
};

}  // namespace pellar
