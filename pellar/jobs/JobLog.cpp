// SPDX-License-Identifier: Apache-2.0
#include "pellar/jobs/JobLog.h"

#include "contract/foundation/Array.h"
#include "contract/foundation/UTF8.h"
#include "contract/pellar/MessageKeys.h"

#include <filesystem>
#include <optional>

namespace pellar {
namespace {

using contract::Dictionary;
using contract::LinePhrase;
using contract::Name;

constexpr int errorLevel = -1;  // always shown, as a heading is
constexpr int mainLevel = 0;
constexpr int detailLevel = 2;

Dictionary message(Name type, std::string_view text, int verbosity)
{
    return Dictionary::of({{contract::kFsckMessageType, type},
                           {contract::kFsckMessageString, text},
                           {contract::kFsckVerbosity, verbosity}});
}

Dictionary untypedMessage(std::string_view text, int verbosity)
{
    return Dictionary::of(
        {{contract::kFsckMessageString, text}, {contract::kFsckVerbosity, verbosity}});
}

struct VerdictLine {
    std::string_view key;
    LinePhrase meaning;
};

std::optional<VerdictLine> verdictLineFor(Verdict verdict, Access access)
{
    switch (verdict) {
        case Verdict::Sound:
            return VerdictLine{"The volume “%@” appears to be OK.", LinePhrase::Success};
        case Verdict::Repaired:
            return VerdictLine{"The volume “%@” was repaired successfully.", LinePhrase::Success};
        case Verdict::Damaged:
            if (access == Access::ReadWrite)
                return VerdictLine{"The volume “%@” could not be repaired.", LinePhrase::Failure};
            return VerdictLine{"The volume “%@” needs to be repaired.", LinePhrase::Failure};
        case Verdict::Inconclusive:
        case Verdict::Failed:
        case Verdict::Stopped: break;
    }
    return std::nullopt;
}

}  // namespace

std::string shownNameOf(const contract::DiskReference& disk, const LineGuard& guard)
{
    const std::string candidates[] = {
        contract::printable(disk.name),
        contract::printable(std::filesystem::path(disk.identifier).filename().string())};
    for (const std::string& name : candidates)
        if (!name.empty() && !guard.isSuspicious(name))
            return name;
    return "volume";
}

JobLog::JobLog(const contract::DiskReference& disk, const Texts& texts, EventRoad& road)
    : texts_(texts), road_(road), guard_(texts), diskName_(shownNameOf(disk, guard_))
{
}

void JobLog::started()
{
    road_.add(Started{});
}

void JobLog::trace(std::string line)
{
    road_.add(Trace{std::move(line)});
}

void JobLog::step(Name type, std::string_view text)
{
    add(message(type, text, 1));
}

// A plain line brings its own line end; a dictionary's text gets one from the module.
void JobLog::detail(std::string_view line)
{
    const std::string text = contract::printable(line);
    if (guard_.isSuspicious(text))
        add(untypedMessage(text, detailLevel));
    else
        road_.add(Message{text + lineEnd_, {}});
}

void JobLog::problem(std::string_view line)
{
    if (problems_.admits(line))
        add(message(contract::kFsckError, contract::printable(line), errorLevel));
    else
        detail(line);
}

void JobLog::error(const Sentence& sentence)
{
    add(message(contract::kFsckError, text(sentence), errorLevel));
}

void JobLog::remark(std::string_view text)
{
    add(untypedMessage(text, mainLevel));
}

void JobLog::failure(std::string_view text)
{
    add(message(contract::kFsckFail, text, mainLevel));
}

void JobLog::progress(double percentOfRun)
{
    if (const std::optional<double> percent = meter_.report(percentOfRun, Clock::now()))
        add(Dictionary::of({{contract::kFsckMessageType, contract::kFsckProgress},
                            {contract::kFsckParameters, contract::Array::of({*percent})}}));
}

void JobLog::endOfRun()
{
    for (const ProblemLimiter::Remainder& rest : problems_.takeRemainders()) {
        const bool isVarious = rest.kind.empty();
        Dictionary line = message(contract::kFsckError,
                                  texts_.text(isVarious ? "… and more problems of other kinds: %1$@"
                                                        : "… and %1$@ more like “%2$@”"),
                                  errorLevel);
        line.set(contract::kFsckParameters,
                 contract::Array::of({rest.count, contract::printable(rest.kind)}));
        add(std::move(line));
    }
}

// The module ends a failure's line itself, a success's it does not.
void JobLog::verdict(Verdict verdict, Access access, bool isForGood)
{
    if (verdict == Verdict::Damaged && access == Access::ReadOnly && isForGood) {
        const Sentence said{"The volume “%1$@” is damaged.", diskName_, {}};
        return add(message(contract::kFsckError, text(said), mainLevel));
    }
    const auto line = verdictLineFor(verdict, access);
    if (!line)
        return;
    const std::string said = contract::format(texts_.resultText(line->key), {diskName_});
    const bool isSuccess = line->meaning == LinePhrase::Success;
    if (guard_.meaningOf(said) == line->meaning)
        road_.add(Message{isSuccess ? said + '\n' : said, {}});
    else  // a translation whose sentence and phrase do not agree
        add(message(isSuccess ? contract::kFsckSuccess : contract::kFsckError, said, mainLevel));
}

void JobLog::finished(contract::ErrorCode mainError, std::int32_t detailError, Name verdict,
                      const std::string& message)
{
    road_.add(
        Finished{mainError, detailError,
                 Dictionary::of({{contract::kPLVerdict, verdict}, {contract::kPLMessage, message}})});
    road_.flush();
}

void JobLog::add(Dictionary dictionary)
{
    road_.add(Message{{}, std::move(dictionary)});
}

}  // namespace pellar
