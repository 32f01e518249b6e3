// SPDX-License-Identifier: Apache-2.0
#include "pellar/jobs/ToolRun.h"

#include "fixwell/host/pellar/MessageKeys.h"
#include "pellar/jobs/DiskNaming.h"

#include <utility>

namespace pellar {

ToolRun::ToolRun(const Tool& tool, std::filesystem::path program, Access access,
                 RunSurroundings surroundings)
    : tool_(tool),
      program_(std::move(program)),
      access_(access),
      surroundings_(surroundings),
      reader_(tool.makeReader())
{
}

RunEvidence ToolRun::run(const DiskClaim& disk, const VolumeFacts& volume)
{
    JobLog& log = surroundings_.log;
    const RunRequest request = requestFor(disk);
    log.trace("run: " + shown(request.command));
    log.step(stepType(), log.text(Sentence{"Running %1$@ on “%2$@”", std::string(tool_.name()),
                                           log.diskName()}));
    surroundings_.road.flush();
    const RunResult result = runTool(request, surroundings_.stop, *this);
    reader_->finish(lines_);
    tellToolLines();
    log.endOfRun();
    tellEndOf(result);
    return {access_, result, reader_->findings(), volume};
}

RunRequest ToolRun::requestFor(const DiskClaim& disk) const
{
    RunRequest request;
    request.command = {program_, tool_.arguments(access_, diskArgumentOfTool(), disk.offset())};
    request.access = access_;
    request.disk = disk.descriptor();
    request.limits = surroundings_.options.outputLimits;
    request.silenceLimit = surroundings_.options.silenceLimit;
    request.graceTimes = graceTimesFor(access_);
    return request;
}

void ToolRun::tellEndOf(const RunResult& result)
{
    JobLog& log = surroundings_.log;
    if (result.cause == StopCause::TooMuchOutput)
        log.failure(log.text(
            Sentence{"%1$@ printed more than a check can need; it was ended and the rest is cut",
                     std::string(tool_.name()),
                     {}}));
    else if (result.cause == StopCause::Silence)
        log.failure(log.text(Sentence{"%1$@ gave no sign of life for too long; it was ended",
                                      std::string(tool_.name()),
                                      {}}));
}

void ToolRun::line(std::string_view line, bool isCut)
{
    reader_->read(line, lines_);
    tellToolLines();
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
                 std::string(tool_.name()),
                 {}}));
}

void ToolRun::tellToolLines()
{
    JobLog& log = surroundings_.log;
    for (const ToolLine& line : lines_) {
        const std::string text = withDiskName(line.text, log.diskName());
        switch (line.kind) {
            case ToolLine::Kind::Phase: log.step(stepType(), log.text(line.phaseKey)); break;
            case ToolLine::Kind::Problem: log.problem(text); break;
            case ToolLine::Kind::Detail: log.detail(text); break;
        }
    }
    lines_.clear();
}

fixwell::Name ToolRun::stepType() const
{
    return access_ == Access::ReadOnly ? fixwell::kFsckVerify : fixwell::kFsckRepair;
}

}  // namespace pellar
