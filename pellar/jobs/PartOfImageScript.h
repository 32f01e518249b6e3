// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/jobs/VolumeScript.h"

#include <memory>

namespace pellar {

/// A job on a volume that is a part of an image file, for a user who may not attach one. Where the
/// tool finds the volume in the file, that is a job as any other. Where it has to be given a
/// device, those who have the right are asked (JobOptions::privileged, which is there). The
/// references outlive it.
class PartOfImageScript final : public Script {
public:
    /// The request has a claim.
    PartOfImageScript(VolumeRequest request, JobContext context);

    void run() override;

private:
    bool needsDevice() const;
    bool canBeTried() const;
    std::unique_ptr<Script> scriptOfOthers();

    VolumeRequest request_;
    JobContext context_;
};

}  // namespace pellar
