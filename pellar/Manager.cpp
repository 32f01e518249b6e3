// SPDX-License-Identifier: Apache-2.0
#include "pellar/Manager.h"

#include "pellar/RepairDisk.h"
#include "pellar/partitions/MapDisk.h"
#include "pellar/partitions/MapOutcome.h"
#include "pellar/tools/Capability.h"

#include <unistd.h>

#include <utility>

namespace pellar {

Manager::Manager(contract::RunLoop& loop, const Texts& texts, JobOptions options)
    : loop_(loop), texts_(texts), options_(std::move(options))
{
}

std::unique_ptr<contract::PLRepairDisk> Manager::makeRepairDisk()
{
    if (delegate_ == nullptr)
        return nullptr;
    auto tool = std::make_unique<RepairDisk>(loop_, texts_, options_, *delegate_);
    latest_ = tool->liveness();
    return tool;
}

std::unique_ptr<RepairDisk> Manager::makeTool(contract::PLAsyncDelegate& delegate)
{
    return std::make_unique<RepairDisk>(loop_, texts_, options_, delegate);
}

void Manager::cancelAgain()
{
    if (const auto tool = latest_.lock())
        (*tool)->cancelCurrentOperation();
}

bool Manager::canVerify(std::string_view filesystemType) const
{
    return capabilityFor(filesystemType, Operation::Verify, options_.toolPath).isGiven();
}

bool Manager::canRepair(std::string_view filesystemType) const
{
    return capabilityFor(filesystemType, Operation::Repair, options_.toolPath, repairWay())
        .isGiven();
}

std::string Manager::reasonAgainst(std::string_view filesystemType, Operation operation) const
{
    return capabilityFor(filesystemType, operation, options_.toolPath, repairWay())
        .reason.in(texts_);
}

bool Manager::canVerifyLive(std::string_view filesystemType) const
{
    return reasonAgainstLive(filesystemType).empty();
}

std::string Manager::reasonAgainstLive(std::string_view filesystemType) const
{
    const Capability capability = liveCapabilityFor(filesystemType, options_.toolPath);
    if (!capability.isGiven())
        return capability.reason.in(texts_);
    const bool hasRights = ::geteuid() == 0 || options_.privileged;
    return hasRights ? std::string()
                     : texts_.text("only an administrator may verify it while it is in use");
}

std::string Manager::reasonAgainstPartitionMap(const contract::DiskReference& disk) const
{
    const PartitionMap map = glanceAtMap(disk);
    // What this user may not read is looked at when the job has the right to.
    const bool isUnknown = !map.boot.isReadable && options_.privileged;
    if (isUnknown || map.kind != PartitionMap::Kind::None)
        return {};
    return outcomeOfMapVerification(map, reportOn(map)).reason.in(texts_);
}

}  // namespace pellar
