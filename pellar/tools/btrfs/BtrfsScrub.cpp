// SPDX-License-Identifier: Apache-2.0
#include "pellar/tools/btrfs/BtrfsScrub.h"

#include "pellar/tools/Judging.h"

#include <array>
#include <charconv>

namespace pellar {
namespace {

constexpr std::string_view toolName = "btrfs";

struct Counter {
    std::string_view name;
    std::uint64_t ScrubReport::*place;
};

// "	csum_errors: 1"
constexpr std::array counters{
    Counter{"read_errors", &ScrubReport::unreadable},
    Counter{"csum_errors", &ScrubReport::wrongChecksums},
    Counter{"verify_errors", &ScrubReport::wrongMetadata},
    Counter{"super_errors", &ScrubReport::wrongSuperblocks},
    Counter{"unverified_errors", &ScrubReport::readAtSecondTry},
    Counter{"uncorrectable_errors", &ScrubReport::withoutGoodCopy},
    Counter{"corrected_errors", &ScrubReport::withGoodCopy},
    Counter{"no_csum", &ScrubReport::withoutChecksum},
    Counter{"malloc_errors", &ScrubReport::unverifiedForMemory},
};

struct FindingText {
    std::uint64_t ScrubReport::*place;
    std::string_view key;
};

constexpr std::array findingTexts{
    FindingText{&ScrubReport::unreadable, "Blocks that cannot be read: %1$@"},
    FindingText{&ScrubReport::wrongChecksums,
                "Blocks that do not agree with their checksums: %1$@"},
    FindingText{&ScrubReport::wrongMetadata,
                "Blocks of the file system itself that are not what they should be: %1$@"},
    FindingText{&ScrubReport::wrongSuperblocks, "Copies of the superblock that are damaged: %1$@"},
    FindingText{&ScrubReport::readAtSecondTry,
                "Blocks that could only be read at a second try: %1$@"},
};

std::uint64_t numberIn(std::string_view text)
{
    std::uint64_t number = 0;
    std::from_chars(text.data(), text.data() + text.size(), number);
    return number;
}

void readCounter(std::string_view line, ScrubReport& report)
{
    const std::size_t colon = line.find(": ");
    if (colon == std::string_view::npos)
        return;
    const std::string_view name = line.substr(1, colon - 1);
    for (const Counter& counter : counters)
        if (counter.name == name)
            report.*counter.place += numberIn(line.substr(colon + 2));
    if (name == "last_physical")  // the last of a disk's
        ++report.tallies;
}

Sentence reasonOfDamage(const ScrubReport& report)
{
    if (report.withoutGoodCopy > 0)
        return {"blocks without any good copy: %1$@; what they held must come from a backup",
                std::to_string(report.withoutGoodCopy),
                {}};
    if (report.withGoodCopy > 0)
        return {
            "all that is damaged has another, good copy, from which “btrfs scrub” can put it "
            "right; nothing was written",
            {},
            {}};
    return {};
}

/// Why the run does not tell whether the volume is sound; none when it does.
std::optional<Sentence> gapIn(const ScrubReport& report, std::size_t disks)
{
    if (report.lacksDisk)
        return Sentence{"a part of it is on another disk, which was not found", {}, {}};
    if (report.unverifiedForMemory > 0)
        return Sentence{"there was too little memory to check everything", {}, {}};
    if (!report.isComplete(disks))
        return Sentence{"%1$@ ended before it had checked everything", std::string(toolName), {}};
    return std::nullopt;
}

}  // namespace

bool ScrubReport::hasDamage() const
{
    return withoutGoodCopy > 0 || withGoodCopy > 0 || !scrubFindings(*this).empty();
}

// With its own statistics for each disk (-d), because those of all together leave out a disk that
// is missing; with the kernel's numbers (-R), because the others call damage corrected.
std::vector<std::string> scrubArguments(const std::string& directory)
{
    return {"scrub", "start", "-B", "-d", "-r", "-R", directory};
}

// Scrub device /dev/sda2 (id 1) done
// WARNING: device 2 not present
// ERROR: Scrub is already running.
// ERROR: scrubbing /mnt failed for device id 1: ret=-1, errno=115 (Operation now in progress)
void readScrubLine(std::string_view line, ScrubReport& report)
{
    if (line.starts_with('\t'))
        readCounter(line, report);
    else if (line.starts_with("Scrub device ") && line.ends_with(") done"))
        ++report.disksDone;
    else if (line.starts_with("Scrub device ") && line.ends_with(") canceled"))
        ++report.disksCancelled;
    else if (line.starts_with("WARNING: device ") && line.ends_with(" not present"))
        report.lacksDisk = true;
    else if (line.starts_with("ERROR: ") &&
             (line.find("already running") != std::string_view::npos ||
              line.find("errno=115 ") != std::string_view::npos))
        report.foundOther = true;
}

Judgement judgeScrub(const RunResult& result, const ScrubReport& report, std::size_t disks)
{
    RunEvidence evidence{Access::ReadOnly, result, {}, {}};
    evidence.findings.hasErrorsLeft = report.hasDamage();
    if (auto judgement = judgementOfEnding(evidence, toolName))
        return *judgement;
    constexpr int foundUncorrectable = 3;
    const int status = std::get<Exited>(result.ending).status;
    if (report.unreadable > 0)
        return unreadable(std::nullopt);
    if (report.hasDamage() || status == foundUncorrectable)
        return damaged(status, reasonOfDamage(report));
    if (report.foundOther)
        return failed(status, {"another program is checking it just now", {}, {}});
    if (report.disksCancelled > 0 && !report.lacksDisk)
        return failed(status, {"another program has ended the check", {}, {}});
    if (status != 0)
        return failed(status, {"%1$@ could not do its work (exit status %2$@)",
                               std::string(toolName), std::to_string(status)});
    if (const auto gap = gapIn(report, disks))
        return inconclusive(status, *gap);
    return sound(status);
}

std::vector<Sentence> scrubFindings(const ScrubReport& report)
{
    std::vector<Sentence> findings;
    for (const FindingText& text : findingTexts)
        if (report.*text.place > 0)
            findings.push_back({text.key, std::to_string(report.*text.place), {}});
    return findings;
}

}  // namespace pellar
