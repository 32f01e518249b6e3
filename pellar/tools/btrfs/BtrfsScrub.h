// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/outcome/Judgement.h"
#include "pellar/process/ProcessRunner.h"

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace pellar {

// How a mounted btrfs volume is verified: by "btrfs scrub", which has the kernel read everything
// that is stored, in every copy, and compare it with its checksums (btrfs-scrub(8), btrfs-progs
// 6.2). It does not see whether the trees agree with each other.

/// What one run told, all disks of the volume together. The numbers are the kernel's
/// (linux/btrfs.h, btrfs_scrub_progress), in blocks of 4 KiB but for superblocks.
struct ScrubReport {
    std::uint64_t unreadable = 0;
    std::uint64_t wrongChecksums = 0;
    std::uint64_t wrongMetadata = 0;
    std::uint64_t wrongSuperblocks = 0;
    std::uint64_t readAtSecondTry = 0;
    std::uint64_t withoutGoodCopy = 0;
    /// The kernel calls these corrected, and in a reading run has corrected nothing.
    std::uint64_t withGoodCopy = 0;
    std::uint64_t withoutChecksum = 0;
    std::uint64_t unverifiedForMemory = 0;

    unsigned disksDone = 0;
    unsigned disksCancelled = 0;
    unsigned tallies = 0;  ///< of disks, read to their last line
    bool lacksDisk = false;
    bool foundOther = false;  ///< another scrub of the volume is running

    /// All of the volume's disks were read, and everything that is said of them has been heard.
    bool isComplete(std::size_t disks) const
    {
        return disksDone == disks && disksCancelled == 0 && disksDone == tallies;
    }
    bool hasDamage() const;
};

/// Of a run that writes nothing to the volume. `directory` is one in it.
[[nodiscard]] std::vector<std::string> scrubArguments(const std::string& directory);

/// Takes in one line.
void readScrubLine(std::string_view line, ScrubReport& report);

/// The exit status alone does not tell: it is 0 where a copy is damaged, and where a disk is
/// missing. `disks` is how many the volume has.
[[nodiscard]] Judgement judgeScrub(const RunResult& result, const ScrubReport& report,
                                   std::size_t disks);

/// What was found, one sentence for each kind.
[[nodiscard]] std::vector<Sentence> scrubFindings(const ScrubReport& report);

}  // namespace pellar
