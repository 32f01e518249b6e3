// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/RunLoop.h"
#include "contract/pellar/PLRepairDisk.h"
#include "pellar/jobs/JobOptions.h"
#include "pellar/outcome/Task.h"
#include "pellar/texts/Texts.h"

#include <memory>
#include <string>
#include <string_view>

namespace pellar {

class RepairDisk;

/// The library as one module sees it. Main thread; outlives the tools made with it, as the run
/// loop and the texts outlive the manager.
class Manager final : public contract::PLManager {
public:
    Manager(contract::RunLoop& loop, const Texts& texts, JobOptions options = {});

    void setDelegate(contract::PLAsyncDelegate* delegate) override { delegate_ = delegate; }
    /// Null when there is no delegate yet.
    std::unique_ptr<contract::PLRepairDisk> makeRepairDisk() override;

    /// For the host's own jobs: what they tell goes to this delegate, which outlives them.
    [[nodiscard]] std::unique_ptr<RepairDisk> makeTool(contract::PLAsyncDelegate& delegate);

    /// Presses the running job of the tool that was made last harder to end; nothing happens when
    /// none runs.
    void cancelAgain();

    /// There is an installed tool that can verify (repair) this kind of file system, by
    /// libblkid's name of it. Looks in a few directories.
    bool canVerify(std::string_view filesystemType) const;
    bool canRepair(std::string_view filesystemType) const;
    /// Why not, in the user's language; empty when it can.
    std::string reasonAgainst(std::string_view filesystemType, Operation operation) const;

    /// Such a volume can be verified while it stays mounted, by this user or an administrator who
    /// is asked; and why it cannot. Looks in a few directories.
    bool canVerifyLive(std::string_view filesystemType) const;
    std::string reasonAgainstLive(std::string_view filesystemType) const;

    /// Why the disk's partition map cannot be verified, in the user's language: it has none, or
    /// cannot be read; empty when it can. Reads a few sectors.
    std::string reasonAgainstPartitionMap(const contract::DiskReference& disk) const;

private:
    RepairWay repairWay() const { return repairWayFor(options_, policyFor(options_)); }

    contract::RunLoop& loop_;
    const Texts& texts_;
    const JobOptions options_;
    contract::PLAsyncDelegate* delegate_ = nullptr;  // not owned
    std::weak_ptr<RepairDisk*> latest_;
};

}  // namespace pellar
