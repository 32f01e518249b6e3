// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/jobs/Job.h"
#include "pellar/outcome/Outcome.h"
#include "pellar/outcome/Result.h"
#include "pellar/partitions/MapDisk.h"
#include "pellar/partitions/MapReport.h"
#include "pellar/partitions/RepairPlan.h"

namespace pellar {

/// Verifies or repairs a disk's partition map: reads and judges it; to repair, plans, keeps what
/// will be overwritten, writes, and reads and judges it again. The references outlive it.
class PartitionMapScript final : public Script {
public:
    PartitionMapScript(contract::DiskReferencePointer disk, Operation operation,
                       JobContext context);

    void run() override;

private:
    Outcome carryOut();
    Result<MapClaim, contract::ErrorCode> claim() const;
    Outcome repair(const MapClaim& claim, const PartitionMap& map, const MapReport& report);
    Outcome write(const MapClaim& claim, const RepairPlan& plan);
    Outcome preview(const MapClaim& claim, const RepairPlan& plan, const Outcome& planned);
    void tellMap(const PartitionMap& map);
    void tell(const Finding& finding);
    void step(Sentence sentence, double percent);
    void report(const Outcome& outcome);

    const contract::DiskReferencePointer disk_;
    const Operation operation_;
    JobContext context_;
    JobLog& log_ = context_.log;
};

}  // namespace pellar
