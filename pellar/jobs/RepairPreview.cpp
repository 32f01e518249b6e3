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

/// Gathers what a listing tells of files.
template <class File>
class ListingReader final : public RunListener {
public:
    using Reading = std::optional<File> (*)(std::string_view line);

    explicit ListingReader(Reading reading) : reading_(reading) {}

    void line(std::string_view line, bool isCut) override
    {
        if (auto file = isCut ? std::nullopt : reading_(line))
            files.push_back(*std::move(file));
    }
    void progressLine(std::string_view) override {}
    void lineLimitReached() override {}
    void pause() override {}
    void tick() override {}

    std::vector<File> files;

private:
    const Reading reading_;
};

/// As many names are told, of each sort; the rest is counted.
constexpr std::size_t mostShown = 50;

/// `shown` is the file.
Sentence sentenceFor(const FileChange& file, const std::string& shown)
{
    const std::string before = file.before ? std::to_string(*file.before) : std::string();
    if (file.after)
        return {"%1$@ would have another size: %2$@ bytes", shown,
                (file.before ? before + " → " : "") + std::to_string(*file.after)};
    return file.before ? Sentence{"%1$@ would be gone: %2$@ bytes", shown, before}
                       : Sentence{"%1$@ would be gone", shown, {}};
}

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
    tellFiles(ranges, counts);
    if (counts.reconnected > 0 && tool_.collectedFiles != nullptr)
        tellCollected();
}

/// By the volume's books, where we can read them; else by what the tool said.
void RepairPreview::tellFiles(const std::vector<ByteRange>& ranges, const FileCounts& counts)
{
    std::vector<FileChange> files = counts.changes;
    if (tool_.files != nullptr)
        files = tool_.files->changes(
            {disk_.descriptor(), disk_.offset(), trial_.descriptor(), trial_.bytes()}, ranges);
    if (!files.empty() && tool_.files != nullptr)
        nameFiles(files);
    const std::size_t shown = std::min(files.size(), mostShown);
    for (const FileChange& file : std::span(files).first(shown))
        log_.remark(sentenceFor(
            file, log_.text(file.name.empty()
                                ? Sentence{"The file in inode %1$@", std::to_string(file.inode), {}}
                                : Sentence{"“%1$@”", contract::printable(file.name), {}})));
    if (shown < files.size())
        log_.remark(Sentence{"… and %1$@ more", std::to_string(files.size() - shown), {}});
}

/// The first of them, as many as a tool can be asked for at once. What is no file goes.
void RepairPreview::nameFiles(std::vector<FileChange>& files)
{
    constexpr std::ptrdiff_t mostNamed = 500;
    const FileComparison& comparison = *tool_.files;
    const std::vector<FileChange> asked(files.begin(),
                                        files.begin() + std::min(std::ssize(files), mostNamed));
    ListingReader<FileChange> listing(comparison.nameIn);
    // What was named before it came to an end is right all the same.
    static_cast<void>(runListing(
        comparison.program,
        comparison.arguments(pathOfDescriptor(diskDescriptorOfTool), disk_.offset(), asked),
        disk_.descriptor(), listing));
    for (FileChange& file : files) {
        const auto named = std::ranges::find(listing.files, file.inode, &FileChange::inode);
        if (named != listing.files.end())
            file.name = named->name;
    }
    std::erase_if(files, [](const FileChange& file) { return file.name.empty() && !file.before; });
}

bool RepairPreview::runListing(std::string_view program, std::vector<std::string> arguments,
                               int disk, RunListener& listing)
{
    RunRequest request;
    request.command = {findProgram(program, context_.options.toolPath), std::move(arguments)};
    request.disk = disk;
    request.limits = context_.options.outputLimits;
    request.graceTimes = graceTimesFor(Access::ReadOnly);
    return !request.command.executable.empty() &&
           runTool(request, context_.stop, listing).ending == Ending(Exited{0});
}

void RepairPreview::tellCollected()
{
    const CollectedFilesReading& reading = *tool_.collectedFiles;
    ListingReader<CollectedFile> listing(reading.fileIn);
    if (!runListing(reading.program, reading.arguments(pathOfDescriptor(diskDescriptorOfTool)),
                    trial_.descriptor(), listing))
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
