// SPDX-License-Identifier: Apache-2.0
#include "pellar/jobs/ToolRun.h"

#include "contract/pellar/MessageKeys.h"
#include "pellar/jobs/DiskNaming.h"

#include <utility>

namespace pellar {

ToolRun::ToolRun(const Tool& tool, std::filesystem::path program, Access access, Problems problems,
                 RunSurroundings surroundings)
    : tool_(tool),
      program_(std::move(program)),
      access_(access),
      problems_(problems),
      surroundings_(surroundings),
      reader_(tool.makeReader())
{
}

RunEvidence ToolRun::run(const DiskForTool& disk, const VolumeFacts& volume)
{
    JobLog& log = surroundings_.log;
    const RunRequest request = requestFor(disk);
    log.trace("run: " + shown(request.command));
    log.step(stepType(), log.text(Sentence{"Running %1$@ on “%2$@”", program_.filename().string(),
                                           log.diskName()}));
    surroundings_.road.flush();
    const RunResult result = runTool(request, surroundings_.stop, *this);
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
    request.command = {program_, tool_.arguments(access_, diskArgumentOfTool(), disk.offset())};
    request.access = access_;
    request.disk = disk.descriptor();
    request.limits = surroundings_.options.outputLimits;
    request.silenceLimit = surroundings_.options.silenceLimit;
    request.graceTimes = isUnstoppable() ? graceTimesOfUnstoppable() : graceTimesFor(access_);
    return request;
}

void ToolRun::tellEndOf(const RunResult& result)
{
    JobLog& log = surroundings_.log;
    if (result.cause == StopCause::TooMuchOutput)
        log.failure(log.text(
            Sentence{"%1$@ printed more than a check can need; it was ended and the rest is cut",
                     program_.filename().string(),
                     {}}));
    else if (result.cause == StopCause::Silence)
        log.failure(log.text(Sentence{"%1$@ gave no sign of life for too long; it was ended",
                                      program_.filename().string(),
                                      {}}));
}

void ToolRun::line(std::string_view line, bool isCut)
{
    reader_->read(line, lines_);
    tellToolLines();
    endIfUnreadable();
    if (isCut)
        surroundings_.log.detail(surroundings_.log.text("(The line above was longer and is cut.)"));
}

void ToolRun::progressLine(std::string_view line)
{
    if (const auto percent = tool_.percentOf(line))
        surroundings_.log.progress(*percent);
}

void ToolRun::lineLimitReached()
{
    surroundings_.log.failure(surroundings_.log.text(
        Sentence{"%1$@ prints very much; the repair goes on, but no more lines are shown",
                 program_.filename().string(),
                 {}}));
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
    surroundings_.stop.press();
}

void ToolRun::stopAsked()
{
    if (isUnstoppable())
        surroundings_.log.remark(surroundings_.log.text(
            Sentence{"%1$@ is writing and cannot be interrupted without damage; the run is let "
                     "come to its end",
                     program_.filename().string(),
                     {}}));
}

void ToolRun::tellToolLines()
{
    JobLog& log = surroundings_.log;
    for (const ToolLine& line : lines_) {
        const std::string text = withDiskName(line.text, log.diskName());
        switch (line.kind) {
            case ToolLine::Kind::Phase: log.step(stepType(), log.text(line.phaseKey)); break;
            case ToolLine::Kind::Problem:
                problems_ == Problems::Kept ? log.detail(text) : log.problem(text);
                break;
            case ToolLine::Kind::Detail: log.detail(text); break;
            case ToolLine::Kind::Progress: log.progress(line.percent); break;
        }
    }
    lines_.clear();
}

contract::Name ToolRun::stepType() const
{
    return access_ == Access::ReadOnly ? contract::kFsckVerify : contract::kFsckRepair;
}

}  // namespace pellar
