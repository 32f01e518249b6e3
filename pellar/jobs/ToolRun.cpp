// SPDX-License-Identifier: Apache-2.0
#include "pellar/jobs/ToolRun.h"

#include "contract/pellar/MessageKeys.h"
#include "pellar/process/ChildProcess.h"

#include <algorithm>
#include <utility>

namespace pellar {
namespace {

std::size_t leadingDigits(std::string_view text)
{
    return std::min(text.find_first_not_of("0123456789"), text.size());
}

}  // namespace

std::string diskArgumentOfTool()
{
    return pathOfDescriptor(diskDescriptorOfTool);
}

std::string withDiskName(std::string_view line, std::string_view diskName)
{
    constexpr std::string_view offset = "?offset=";
    static const std::string argument = diskArgumentOfTool();
    std::string result;
    for (std::size_t at = line.find(argument); at != std::string_view::npos;
         at = line.find(argument)) {
        const bool isOurs = leadingDigits(line.substr(at + argument.size())) == 0;
        result += line.substr(0, at);
        result += isOurs ? diskName : std::string_view(argument);
        line.remove_prefix(at + argument.size());
        if (isOurs && line.starts_with(offset))
            line.remove_prefix(offset.size() + leadingDigits(line.substr(offset.size())));
    }
    return result.append(line);
}

ToolRun::ToolRun(const Tool& tool, std::filesystem::path program, Access access, Problems problems,
                 JobContext& context)
    : tool_(tool),
      program_(std::move(program)),
      access_(access),
      problems_(problems),
      context_(context),
      reader_(tool.makeReader())
{
}

void ToolRun::readLog(std::vector<std::uint64_t> parts)
{
    logParts_ = std::move(parts);
    reader_ = tool_.logReading->makeReader();
}

RunEvidence ToolRun::run(const DiskForTool& disk, const VolumeFacts& volume)
{
    JobLog& log = context_.log;
    const RunRequest request = requestFor(disk);
    // A repair is the work of the tool that writes.
    namesTool_ = access_ == Access::ReadWrite || log.tool().empty();
    if (namesTool_)
        log.setTool(program_.filename());
    log.trace("run: " + shown(request.command));
    log.step(operation(), {"Running %1$@ on “%2$@”", program_.filename(), log.diskName()});
    log.flush();
    const RunResult result = runTool(request, context_.stop, *this);
    reader_->finish(lines_);
    tellToolLines();
    log.endOfRun();
    tellEndOf(result);
    return {access_, result, reader_->findings(), volume};
}

RunRequest ToolRun::requestFor(const DiskForTool& disk) const
{
    RunRequest request;
    request.wantsTerminal = tool_.habits.wantsTerminal;
    request.ignoresStops = isUnstoppable();
    request.command = {
        program_, logParts_.empty() ? tool_.arguments(access_, diskArgumentOfTool(), disk.offset())
                                    : tool_.logReading->arguments(logParts_, diskArgumentOfTool())};
    request.access = access_;
    request.disk = disk.descriptor();
    request.limits = context_.options.outputLimits;
    request.silenceLimit = context_.options.silenceLimit;
    request.graceTimes = isUnstoppable() ? graceTimesOfUnstoppable() : graceTimesFor(access_);
    return request;
}

void ToolRun::tellEndOf(const RunResult& result)
{
    if (result.cause == StopCause::TooMuchOutput)
        context_.log.failure(
            aboutTool("%1$@ printed more than a check can need; it was ended and the rest is cut"));
    else if (result.cause == StopCause::Silence)
        context_.log.failure(aboutTool("%1$@ gave no sign of life for too long; it was ended"));
}

void ToolRun::line(std::string_view line, bool isCut)
{
    nameTool(line);
    reader_->read(line, lines_);
    tellToolLines();
    endIfUnreadable();
    if (isCut)
        context_.log.detail(Sentence{"(The line above was longer and is cut.)", {}, {}});
}

void ToolRun::nameTool(std::string_view line)
{
    const auto version = namesTool_ ? versionBehind(tool_.banner, line) : std::string_view();
    if (version.empty())
        return;
    context_.log.setTool(program_.filename().native() + ' ' + std::string(version));
    namesTool_ = false;
}

void ToolRun::progressLine(std::string_view line)
{
    if (const auto percent = tool_.percentOf(line))
        context_.log.progress(*percent);
}

void ToolRun::lineLimitReached()
{
    context_.log.failure(
        aboutTool("%1$@ prints very much; the repair goes on, but no more lines are shown"));
}

bool ToolRun::isUnstoppable() const
{
    return access_ == Access::ReadWrite && !tool_.habits.endsInOrder;
}

/// What is written where the disk fails is written without knowing what it replaces. A tool that
/// leaves the disk in order is ended; the others give up by themselves, or are let come to their
/// end.
void ToolRun::endIfUnreadable()
{
    const auto& fault = reader_->findings().readFault;
    if (isEnded_ || access_ == Access::ReadOnly || !tool_.habits.endsInOrder || !fault ||
        fault->isUnproven)
        return;
    isEnded_ = true;
    context_.stop.press();
}

void ToolRun::stopAsked()
{
    if (isUnstoppable())
        context_.log.remark(
            aboutTool("%1$@ is writing and cannot be interrupted without damage; the run is let "
                      "come to its end"));
}

void ToolRun::tellToolLines()
{
    JobLog& log = context_.log;
    for (const ToolLine& line : lines_) {
        const std::string text = withDiskName(line.text, log.diskName());
        switch (line.kind) {
            case ToolLine::Kind::Phase: log.step(operation(), {line.phaseKey, {}, {}}); break;
            case ToolLine::Kind::Problem:
                problems_ == Problems::Kept ? log.detail(text) : log.problem(text);
                break;
            case ToolLine::Kind::Detail:
                if (logParts_.empty())
                    log.detail(text);
                break;
            case ToolLine::Kind::Progress: log.progress(line.percent); break;
        }
    }
    lines_.clear();
}

Operation ToolRun::operation() const
{
    return access_ == Access::ReadOnly ? Operation::Verify : Operation::Repair;
}

}  // namespace pellar
