// SPDX-License-Identifier: Apache-2.0
#include "orvane/jobs/Report.h"

#include "contract/foundation/Format.h"
#include "contract/foundation/UTF8.h"
#include "contract/pellar/MessageKeys.h"
#include "orvane/jobs/LogRecord.h"
#include "orvane/support/ProgramStart.h"
#include "orvane/support/files/WholeFile.h"
#include "orvane/support/history/RunStart.h"
#include "orvane/support/texts/Language.h"
#include "orvane/support/texts/Quantities.h"
#include "pellar/outcome/Task.h"

#include <sys/utsname.h>

#include <algorithm>
#include <utility>

namespace orvane {
namespace {

using contract::printable;
using Kind = ReportLine::Kind;
using Tone = ReportLine::Tone;

constexpr std::size_t largestReleaseFile = 64U << 10U;

/// `PRETTY_NAME="Debian GNU/Linux 12 (bookworm)"`, with the escapes of a shell (os-release(5)).
std::string prettyNameIn(std::string_view file)
{
    constexpr std::string_view key = "PRETTY_NAME=";
    std::size_t begin = file.starts_with(key) ? 0 : file.find("\n" + std::string(key));
    if (begin == std::string_view::npos)
        return {};
    begin += file[begin] == '\n' ? 1 : 0;
    std::string_view value = file.substr(begin + key.size());
    value = value.substr(0, value.find('\n'));
    const bool isQuoted =
        value.size() >= 2 && (value[0] == '"' || value[0] == '\'') && value.back() == value.front();
    if (isQuoted)
        value = value.substr(1, value.size() - 2);
    std::string name;
    for (std::size_t i = 0; i < value.size(); ++i) {
        if (value[i] == '\\' && i + 1 < value.size())
            ++i;
        name += value[i];
    }
    return printable(name);
}

std::string_view actionTitle(std::string_view action)
{
    const auto task = pellar::taskNamed(action);
    if (!task)
        return action;
    switch (task->operation) {
        case pellar::Operation::Undo: return "Undoing a repair";
        case pellar::Operation::Finish: return "Finishing a repair";
        case pellar::Operation::Verify:
            return task->subject == pellar::Subject::Permissions ? "Verification of permissions"
                   : task->subject == pellar::Subject::PartitionMap
                       ? "Verification of the partition map"
                       : "Verification of the file system";
        case pellar::Operation::Repair: break;
    }
    return task->subject == pellar::Subject::Permissions    ? "Repair of permissions"
           : task->subject == pellar::Subject::PartitionMap ? "Repair of the partition map"
                                                            : "Repair of the file system";
}

Tone toneOf(std::string_view verdict)
{
    if (verdict == contract::kPLVerdictDamaged.text())
        return Tone::Bad;
    const bool isGood = verdict == contract::kPLVerdictSound.text() ||
                        verdict == contract::kPLVerdictRepaired.text();
    return isGood ? Tone::Good : Tone::Plain;
}

/// By the colour that the module has given it.
Tone toneOf(const contract::TextStyle& style)
{
    if (!style.color)
        return Tone::Plain;
    const double lean = style.color->red - style.color->green;
    return lean > 0.3 ? Tone::Bad : lean < -0.3 ? Tone::Good : Tone::Plain;
}

/// A row's text is one line with its end.
ReportLine rowOf(const contract::Dictionary& record)
{
    const contract::StyledText text = record[finalTextKey].styledText();
    std::string_view characters = text.characters();
    while (characters.ends_with('\n'))
        characters.remove_suffix(1);
    return {Kind::Row, printable(characters), "", toneOf(text.style()),
            text.style().font && text.style().font->isBold};
}

std::int64_t verbosityOf(const contract::Dictionary& record)
{
    return record.integer(contract::kFsckVerbosity);
}

}  // namespace

ComputerFacts computerFacts(const std::vector<std::filesystem::path>& releaseFiles)
{
    ComputerFacts facts;
    utsname names{};
    if (::uname(&names) == 0)
        facts.kernel =
            printable(std::string(names.sysname) + " " + names.release + " " + names.machine);
    for (const std::filesystem::path& file : releaseFiles) {
        const auto contents = readWholeFile(file, largestReleaseFile);
        if (contents && facts.distribution.empty())
            facts.distribution = prettyNameIn(*contents);
    }
    return facts;
}

Report::Report(const std::vector<std::shared_ptr<Disk>>& disks, SupportHost& host,
               ReportScope scope)
    : host_(host), hasDetails_(scope.hasDetails)
{
    std::string names;
    for (const auto& disk : disks) {
        addChapters(disk, scope);
        names += (names.empty() ? "" : ", ") + disk->displayName();
    }
    title_ = host_.translator().sentence("Report on %@", {names});
    tellHead();
}

void Report::addChapters(const std::shared_ptr<Disk>& disk, ReportScope scope)
{
    const bool isKnown = std::ranges::any_of(
        chapters_, [&disk](const Chapter& chapter) { return chapter.disk == disk; });
    if (isKnown)
        return;
    // The oldest records belong to it, too.
    static_cast<void>(disk->fsckHistoryNoChildren());
    host_.histories().loadAll();
    Chapter chapter{.disk = disk,
                    .runs = host_.historyStore().runs(host_.histories().keyOf(disk->facts())),
                    .records = disk->fsckHistoryNoChildren()};
    chapter.end = chapter.records.size();
    // The log does not show it either (contract::verbosity::summary).
    if (chapter.end > 0 && verbosityOf(chapter.records.at(chapter.end - 1).dictionary()) ==
                               contract::verbosity::summary)
        --chapter.end;
    if (scope.isLastRunAlone)
        limitToLastRun(chapter);
    records_ += chapter.end - chapter.next;
    chapters_.push_back(std::move(chapter));
    if (disk->contents())
        addChapters(disk->contents(), scope);
    for (const auto& part : disk->parts())
        addChapters(part, scope);
}

// A run of which no record is kept is told without rows.
void Report::limitToLastRun(Chapter& chapter)
{
    std::size_t start = chapter.end;
    while (start > 0 && !isStartOfRun(chapter.records.at(start - 1).dictionary()))
        --start;
    chapter.next = start > 0 ? start - 1 : 0;
    if (chapter.runs.empty())
        return;
    chapter.nextRun = chapter.runs.size() - 1;
    const auto known = start > 0
                           ? host_.histories().runOf(chapter.records.at(start - 1).dictionary())
                           : std::nullopt;
    if (!known || (known->run && known->run->started != chapter.runs.back().started))
        chapter.next = chapter.end;
}

void Report::fact(std::string_view name, const std::string& text)
{
    if (!text.empty())
        say({Kind::Fact, printable(text), this->text(name)});
}

std::string Report::sizeText(std::uint64_t bytes) const
{
    return host_.translator().sentence(
        "%@ (%@ bytes)",
        {byteCount(bytes), decimalText(static_cast<std::int64_t>(bytes), currentLanguage())});
}

void Report::tellHead()
{
    say({Kind::Title, title_});
    fact("Written", zonedTime(std::chrono::system_clock::now()));
    fact("Program", "Orvane " + std::string(programVersion()));
    std::string tools;
    for (const Chapter& chapter : chapters_)
        for (std::size_t i = chapter.nextRun; i < chapter.runs.size(); ++i) {
            const auto& end = chapter.runs[i].end;
            if (end && !end->tool.empty() && tools.find(end->tool) == std::string::npos)
                tools += (tools.empty() ? "" : ", ") + end->tool;
        }
    fact("Checking tools", tools);
    const ComputerFacts computer = computerFacts();
    fact("System", computer.distribution);
    fact("Kernel", computer.kernel);
}

void Report::tellDisk(const Disk& disk)
{
    const DiskFacts& facts = disk.facts();
    const Translator& texts = host_.translator();
    say({Kind::Disk, disk.displayName()});
    const bool isFile =
        !facts.imagePath.empty() || facts.storage == contract::DiskReference::Storage::FileRegion;
    const auto& path = facts.imagePath.empty() ? facts.path : facts.imagePath;
    fact(isFile ? "File" : "Device", path.native());
    if (isFile && facts.offset != 0)
        fact("Begins at", sizeText(facts.offset));
    fact("Format", facts.filesystem);
    if (facts.length != 0)
        fact("Size", sizeText(facts.length));
    if (facts.space)
        fact("Used", texts.sentence("%@ of %@",
                                    {byteCount(facts.space->used), byteCount(facts.space->total)}));
    fact("Mounted at", facts.mountPoint);
    fact("Model", facts.model);
    fact("UUID", facts.uuid);
    if (facts.hasSMARTError)
        say({Kind::Fact, text("its drive says that it is failing"), text("Health"), Tone::Bad});
    else if (!isFile)
        fact("Health", text("no failure known"));
    tellParts(disk);
}

void Report::tellParts(const Disk& disk)
{
    if (disk.facts().hasDamagedMap)
        say({Kind::Fact, text("its partition map is damaged"), text("Partition map"), Tone::Bad});
    if (!disk.isWhole())
        return;
    for (const auto& part : disk.parts()) {
        const DiskFacts& facts = part->facts();
        std::string line = std::to_string(facts.number) + "  " + byteCount(facts.length);
        if (!facts.filesystem.empty())
            line += "  " + facts.filesystem;
        line += "  " + part->displayName();
        if (facts.storage == contract::DiskReference::Storage::FileRegion)
            line += "  " + host_.translator().sentence("begins at byte %@",
                                                       {std::to_string(facts.offset)});
        say({Kind::Part, printable(line)});
    }
}

void Report::tellRun(const Run& run)
{
    const Translator& texts = host_.translator();
    const std::string verdict = run.verdict();
    say({Kind::Run,
         printable(zonedTime(run.started) + " · " + texts.text(actionTitle(run.action)) + " · " +
                   texts.text(verdict.empty() ? std::string_view("cut off") : verdict)),
         "", toneOf(verdict)});
    // A clock that was set back in the middle of a run measures nothing.
    if (run.finished && *run.finished >= run.started)
        fact("Duration", durationText(*run.finished - run.started, texts));
    if (!run.end)
        return;
    fact("Tool", run.end->tool);
    if (run.end->problems > 0)
        fact("Problems", std::to_string(run.end->problems));
    fact("Result", run.end->message);
}

void Report::tellRunsBefore(Chapter& chapter, RecordTimes::Time time)
{
    for (; chapter.nextRun < chapter.runs.size() && chapter.runs[chapter.nextRun].started < time;
         ++chapter.nextRun)
        tellRun(chapter.runs[chapter.nextRun]);
}

void Report::tellRecord(Chapter& chapter)
{
    const contract::Dictionary record = chapter.records.at(chapter.next++).dictionary();
    ++told_;
    if (!record)
        return;  // cleared meanwhile
    if (isStartOfRun(record))
        if (const auto known = host_.histories().runOf(record)) {
            tellRunsBefore(chapter, known->run ? known->run->started : known->time);
            if (known->run && chapter.nextRun < chapter.runs.size()) {
                tellRun(chapter.runs[chapter.nextRun++]);
            } else {
                say({Kind::Run, zonedTime(known->time)});
            }
        }
    if (!hasDetails_ && verbosityOf(record) >= contract::verbosity::detail)
        return;
    // What the log shows as an empty line is room between runs.
    if (ReportLine row = rowOf(record); row.text.find_first_not_of(' ') != std::string::npos)
        say(std::move(row));
}

/// NO at the end.
bool Report::advance()
{
    if (chapter_ >= chapters_.size())
        return false;
    Chapter& chapter = chapters_[chapter_];
    if (!std::exchange(chapter.isBegun, true)) {
        tellDisk(*chapter.disk);
        // What has parts, or something in it, is checked by these.
        const Disk& disk = *chapter.disk;
        const bool isBearer = disk.contents() != nullptr || !disk.parts().empty();
        if (chapter.runs.empty() && chapter.end == 0 && !isBearer)
            fact("Checks", text("never checked"));
    } else if (chapter.next < chapter.end) {
        tellRecord(chapter);
    } else {
        tellRunsBefore(chapter, RecordTimes::Time::max());
        ++chapter_;
    }
    return true;
}

std::optional<ReportLine> Report::next()
{
    while (ready_.empty())
        if (!advance())
            return std::nullopt;
    ReportLine line = std::move(ready_.front());
    ready_.pop_front();
    return line;
}

double Report::progress() const
{
    return records_ == 0 ? 1 : static_cast<double>(told_) / static_cast<double>(records_);
}

}  // namespace orvane
