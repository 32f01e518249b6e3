// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/jobs/Job.h"
#include "pellar/jobs/RecordedRestoring.h"
#include "pellar/outcome/Outcome.h"
#include "pellar/outcome/Result.h"
#include "pellar/packages/Reference.h"
#include "pellar/packages/RootDirectory.h"
#include "pellar/permissions/Inspection.h"
#include "pellar/permissions/PermissionsOutcome.h"

#include <optional>

namespace pellar {

/// Verifies or repairs the permissions of the files that packages installed on a mounted volume,
/// which is the root of a system: reads what the packages say, compares, and to repair sets what
/// differs and compares everything again. Files of which it is not known how they should be are
/// counted and never changed. The references outlive it.
class PermissionsScript final : public Script {
public:
    /// Main thread.
    PermissionsScript(contract::DiskReferencePointer disk, Operation operation, JobContext context);

    void run() override;

private:
    enum class Pass { Verify, Repair, Confirm };

    Outcome carryOut();
    Outcome treat(const RootDirectory& root, const References& references);
    Result<References, Sentence> readReferences(const RootDirectory& root);
    std::optional<Tally> look(const RootDirectory& root, const References& references, Pass pass);
    void lookAt(const RootDirectory& root, const Reference& reference, Pass pass, Tally& tally);
    void tellUnseen(const Reference& reference, Unseen unseen);
    void tell(const Reference& reference, const FoundFile& file, const Difference& difference);
    bool mayBeLentRights(const Reference& reference, const FoundFile& file, Tally& tally);
    void repair(const Reference& reference, FoundFile file);
    Outcome outcomeOfRepair(const Tally& afterwards) const;
    void tellDatabaseIsRead();
    void tell(const Tally& tally);
    void tellWhatIsMissing(const Tally& tally);
    void step(std::string_view key);
    void report(const Outcome& outcome);

    const contract::DiskReferencePointer disk_;
    const Operation operation_;
    JobContext context_;
    JobLog& log_ = context_.log;
    const bool fetchesArchives_;
    Accounts accounts_;
    std::optional<RecordedRestoring> restoring_;  ///< of a repair
};

}  // namespace pellar
