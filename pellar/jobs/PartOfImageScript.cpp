// SPDX-License-Identifier: Apache-2.0
#include "pellar/jobs/PartOfImageScript.h"

#include "pellar/process/Command.h"
#include "pellar/tools/ToolTable.h"

#include <utility>

namespace pellar {

PartOfImageScript::PartOfImageScript(VolumeRequest request, JobContext context)
    : request_(std::move(request)), context_(std::move(context))
{
}

void PartOfImageScript::run()
{
    const DiskClaim& claim = *request_.claim;
    if (request_.tool == nullptr && request_.disk->filesystem.empty())
        request_.tool = toolRecognizing(claim.descriptor(), claim.offset(), claim.availableBytes());
    if (needsDevice())
        scriptOfOthers()->run();
    else
        VolumeScript(std::move(request_), std::move(context_)).run();
}

/// No password is asked for where the job would end with a reason anyway.
bool PartOfImageScript::needsDevice() const
{
    const Tool* const tool = request_.tool;
    if (tool == nullptr || tool->habits.takesOffset || canBeTried())
        return false;
    const bool isRepair = request_.operation == Operation::Repair;
    return !findProgram(tool->name, context_.options.toolPath).empty() &&
           (!isRepair || (tool->repairs(context_.repairWay()) &&
                          !findProgram(tool->repairName, context_.options.toolPath).empty()));
}

/// Where repairs can be tried, a tool is shown the part alone.
bool PartOfImageScript::canBeTried() const
{
    if (context_.repairWay() == RepairWay::Direct)
        return false;
    const DiskClaim& claim = *request_.claim;
    return static_cast<bool>(TrialDisk::of(claim.descriptor(),
                                           {claim.offset(), claim.availableBytes()},
                                           context_.options.trials.room));
}

std::unique_ptr<Script> PartOfImageScript::scriptOfOthers()
{
    PrivilegedJob job{
        {Subject::Filesystem, request_.operation}, *request_.disk, nullptr, false, context_.policy};
    job.image = std::make_shared<const DiskClaim>(*std::exchange(request_.claim, std::nullopt));
    return context_.options.privileged(job, context_.stop, context_.events);
}

}  // namespace pellar
