// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/pellar/DiskReference.h"
#include "pellar/jobs/Job.h"
#include "pellar/mounts/MountTable.h"
#include "pellar/outcome/Outcome.h"
#include "pellar/process/ProcessRunner.h"
#include "pellar/tools/btrfs/BtrfsScrub.h"
#include "pellar/tools/btrfs/MountedBtrfs.h"

#include <filesystem>
#include <optional>
#include <vector>

namespace pellar {

/// Verifies a btrfs volume that stays mounted, because the system or the user works on it: the
/// kernel reads all of it and compares it with its checksums. Nothing is written to it. Needs
/// root. The references outlive it.
class LiveVolumeScript final : public Script, private RunListener {
public:
    /// `mounts` is where the disk is mounted, not empty.
    LiveVolumeScript(contract::DiskReferencePointer disk, std::vector<Mount> mounts,
                     JobContext context);

    void run() override;

private:
    Outcome verify();
    std::optional<Outcome> findVolume();
    int reachVolume();
    bool isStillThere() const;
    RunRequest request() const;
    Judgement scrub();
    void tellFindings(const Judgement& judgement);

    void line(std::string_view line, bool isCut) override;
    void progressLine(std::string_view) override {}
    void lineLimitReached() override {}
    void stopAsked() override;
    void pause() override { log_.flush(); }
    void tick() override;

    const contract::DiskReferencePointer disk_;
    const std::vector<Mount> mounts_;
    JobContext context_;
    JobLog& log_ = context_.log;

    FileDescriptor device_;
    std::optional<MountedBtrfs> volume_;
    std::filesystem::path program_;
    std::uint64_t storedBytes_ = 0;
    ScrubReport report_;
    bool isStopping_ = false;
};

}  // namespace pellar
