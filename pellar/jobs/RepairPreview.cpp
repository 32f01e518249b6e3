// SPDX-License-Identifier: Apache-2.0
#include "pellar/jobs/RepairPreview.h"

#include "contract/foundation/UTF8.h"
#include "contract/pellar/ErrorCodes.h"
#include "pellar/jobs/RecordedWriting.h"
#include "pellar/process/ChildProcess.h"
#include "pellar/tools/Judging.h"

#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <utility>
#include <vector>

namespace pellar {
namespace {

bool isZero(ByteView bytes)
{
    return std::ranges::all_of(bytes, [](std::uint8_t byte) { return byte == 0; });
}

/// 0 or an errno. Where there is nothing but zeros the file has holes.
int copyInto(int file, WorkingCopy& overlay, const std::function<bool()>& isStopped)
{
    Bytes buffer(1U << 20U);
    for (std::uint64_t at = 0; at < overlay.bytes(); at += buffer.size()) {
        const std::span part(buffer.data(),
                             std::min<std::uint64_t>(buffer.size(), overlay.bytes() - at));
        if (isStopped())
            return ECANCELED;
        if (const int error = overlay.read(at, part))
            return error;
        const auto place = static_cast<off_t>(at);
        if (!isZero(part) &&
            ::pwrite(file, part.data(), part.size(), place) != static_cast<ssize_t>(part.size()))
            return errno != 0 ? errno : ENOSPC;
    }
    return ::ftruncate(file, static_cast<off_t>(overlay.bytes())) == 0 && ::fsync(file) == 0
               ? 0
               : errno;
}

/// Gathers the files that a directory's listing tells of.
class ListingReader final : public RunListener {
public:
    explicit ListingReader(const CollectedFilesReading& reading) : reading_(reading) {}

    void line(std::string_view line, bool isCut) override
    {
        if (auto file = isCut ? std::nullopt : reading_.fileIn(line))
            files.push_back(*std::move(file));
    }
    void progressLine(std::string_view) override {}
    void lineLimitReached() override {}
    void pause() override {}
    void tick() override {}

    std::vector<CollectedFile> files;

private:
    const CollectedFilesReading& reading_;
};

}  // namespace

Outcome RepairPreview::tell(const Outcome& tried, const FileCounts& counts)
{
    const bool isProven = tried.verdict == Verdict::Sound || tried.verdict == Verdict::Repaired;
    if (!isProven && tried.verdict != Verdict::Damaged)
        return tried;
    const auto ranges = trial_.contents().differences();
    if (!ranges)
        return outcomeOfVerification(unreadable(trial_.contents().firstUnreadable()));
    tellChanges(*ranges, tried, counts);
    if (const auto failure = writeImage())
        return failedOutcome(contract::kPLErrorCannotOpen, *failure);
    if (!isProven)
        return {Verdict::Damaged,
                contract::kPLErrorNotProven,
                0,
                {"a repair was tried, and would leave damage; nothing was written", {}, {}},
                {}};
    if (ranges->empty())
        return tried;
    return {Verdict::Damaged,
            contract::kPLErrorDamaged,
            0,
            {"a repair was tried, and would make it sound; nothing was written", {}, {}},
            {}};
}

void RepairPreview::tellChanges(const std::vector<ByteRange>& ranges, const Outcome& tried,
                                const FileCounts& counts)
{
    log_.remark(changesOf(ranges));
    if (counts.before && counts.after)
        log_.remark(Sentence{"The volume has %1$@ files, and would have %2$@ after the repair.",
                             std::to_string(*counts.before), std::to_string(*counts.after)});
    for (const Sentence& warning : tried.warnings)
        log_.remark(Sentence{"After the repair: %1$@.", log_.text(warning), {}});
    if (counts.reconnected > 0 && tool_.collectedFiles != nullptr)
        tellCollected();
}

void RepairPreview::tellCollected()
{
    constexpr std::size_t mostShown = 50;
    const CollectedFilesReading& reading = *tool_.collectedFiles;
    RunRequest request;
    request.command = {findProgram(reading.program, context_.options.toolPath),
                       reading.arguments(pathOfDescriptor(diskDescriptorOfTool))};
    request.disk = trial_.descriptor();
    request.limits = context_.options.outputLimits;
    request.graceTimes = graceTimesFor(Access::ReadOnly);
    ListingReader listing(reading);
    if (request.command.executable.empty() ||
        runTool(request, context_.stop, listing).ending != Ending(Exited{0}))
        return;
    const std::size_t shown = std::min(mostShown, listing.files.size());
    for (const CollectedFile& file : std::span(listing.files).first(shown))
        log_.detail(Sentence{"In lost+found after the repair: “%1$@”, %2$@ bytes",
                             contract::printable(file.name), std::to_string(file.bytes)});
    if (shown < listing.files.size())
        log_.detail(Sentence{"… and %1$@ more", std::to_string(listing.files.size() - shown), {}});
}

/// None when no image is wanted, or it is there.
std::optional<Sentence> RepairPreview::writeImage()
{
    const std::filesystem::path& path = context_.policy.keptImage;
    if (path.empty())
        return std::nullopt;
    const std::string shown = contract::printable(path.native());
    log_.step(Operation::Repair, {"Writing the repaired volume to %1$@", shown, {}});
    const FileDescriptor file(::open(path.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0600));
    const int error =
        file ? copyInto(file.get(), trial_.contents(), workOf(context_).isStopped) : errno;
    if (error == 0) {
        log_.remark(Sentence{"The repaired volume is in %1$@.", shown, {}});
        return std::nullopt;
    }
    if (file)
        ::unlink(path.c_str());
    return Sentence{"the repaired volume could not be written to %1$@: %2$@", shown,
                    ::strerrordesc_np(error)};
}

}  // namespace pellar
