// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/ManagerOptions.h"
#include "pellar/jobs/JobLog.h"
#include "pellar/jobs/Script.h"
#include "pellar/outcome/Outcome.h"
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
    PermissionsScript(contract::DiskReferencePointer disk, Operation operation,
                      const ManagerOptions& options, const Texts& texts, StopSwitch& stop,
                      EventRoad& road);

    void run() override;

private:
    enum class Pass { Verify, Repair, Confirm };

    Outcome carryOut();
    Outcome treat(const RootDirectory& root, const References& references);
    std::variant<References, Sentence> readReferences(const RootDirectory& root);
    std::optional<Tally> look(const RootDirectory& root, const References& references, Pass pass);
    void lookAt(const RootDirectory& root, const Reference& reference, Pass pass, Tally& tally);
    void tellUnseen(const Reference& reference, Unseen unseen);
    void tell(const Reference& reference, const FoundFile& file, const Difference& difference);
    bool mayBeLentRights(const Reference& reference, const FoundFile& file, Tally& tally);
    void repair(const RootDirectory& root, const Reference& reference, const FoundFile& file);
    void tellDatabaseIsRead();
    void tell(const Tally& tally);
    void tellWhatIsMissing(const Tally& tally);
    void step(std::string_view key);
    void report(const Outcome& outcome);

    const contract::DiskReferencePointer disk_;
    const Operation operation_;
    const ManagerOptions& options_;
    const bool fetchesArchives_;
    const Texts& texts_;
    StopSwitch& stop_;
    EventRoad& road_;
    JobLog log_;
    Accounts accounts_;
    std::uint64_t restored_ = 0;
};

}  // namespace pellar
