// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/jobs/JobScript.h"

namespace pellar {

/// A job on a volume that is a part of an image file, for a user who may not attach one. Where the
/// tool finds the volume in the file, that is a job as any other. Where it has to be given a
/// device, those who have the right are asked (ManagerOptions::privileged, which is there). The
/// references outlive it.
class PartOfImageScript final : public Script {
public:
    /// The request has a claim.
    PartOfImageScript(JobRequest request, const ManagerOptions& options, const Texts& texts,
                      StopSwitch& stop, EventRoad& road);

    void run() override;

private:
    bool needsDevice() const;
    std::unique_ptr<Script> scriptOfOthers();

    JobRequest request_;
    const ManagerOptions& options_;
    const Texts& texts_;
    StopSwitch& stop_;
    EventRoad& road_;
};

}  // namespace pellar
