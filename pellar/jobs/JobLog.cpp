// SPDX-License-Identifier: Apache-2.0
#include "pellar/jobs/JobLog.h"

#include "contract/foundation/Array.h"
#include "contract/foundation/UTF8.h"
#include "contract/pellar/MessageKeys.h"

#include <algorithm>
#include <filesystem>
#include <optional>
#include <string>
#include <utility>
#include <vector>

namespace pellar {
namespace {

std::vector<std::string> localizedPhrases(const Texts& texts)
{
    std::vector<std::string> phrases;
    for (const contract::ResultPhrase& phrase : contract::resultPhrases)
        phrases.push_back(texts.resultText(phrase.key));
    return phrases;
}

std::vector<std::string> suspiciousPhrases(const Texts& texts)
{
    std::vector<std::string> phrases = localizedPhrases(texts);
    for (const contract::ResultPhrase& phrase : contract::resultPhrases)
        phrases.emplace_back(phrase.key);
    phrases.emplace_back(contract::errorMarker);
    return phrases;
}

constexpr std::size_t longestKind = 200;

bool isDigit(char c)
{
    return c >= '0' && c <= '9';
}

/// The question that e2fsck puts behind a problem says nothing about its kind.
std::string_view withoutQuestion(std::string_view problem)
{
    const bool isQuestion = problem.ends_with("? no") || problem.ends_with("? yes");
    const std::size_t sentence = problem.rfind(". ");
    return isQuestion && sentence != std::string_view::npos ? problem.substr(0, sentence + 1)
                                                            : problem;
}

/// A name may hold quotes itself, so everything from the first to the last is the name.
std::string withoutQuoted(std::string_view text)
{
    const std::size_t first = text.find('\'');
    const std::size_t last = text.rfind('\'');
    if (first == last)
        return std::string(text);
    return std::string(text.substr(0, first + 1)) + "…" + std::string(text.substr(last));
}

using contract::Dictionary;
using contract::LinePhrase;
using contract::Name;

struct VerdictLine {
    std::string_view key;
    LinePhrase meaning;
};

std::optional<VerdictLine> verdictLineFor(Verdict verdict, Operation operation)
{
    switch (verdict) {
        case Verdict::Sound:
            return VerdictLine{"The volume “%@” appears to be OK.", LinePhrase::Success};
        case Verdict::Repaired:
            return VerdictLine{"The volume “%@” was repaired successfully.", LinePhrase::Success};
        case Verdict::Damaged:
            if (operation == Operation::Repair)
                return VerdictLine{"The volume “%@” could not be repaired.", LinePhrase::Failure};
            return VerdictLine{"The volume “%@” needs to be repaired.", LinePhrase::Failure};
        case Verdict::Inconclusive:
        case Verdict::Failed:
        case Verdict::Stopped: break;
    }
    return std::nullopt;
}

}  // namespace

VerdictPhrases::VerdictPhrases(const Texts& texts)
    : localized_(localizedPhrases(texts)), everything_(suspiciousPhrases(texts))
{
}

bool VerdictPhrases::isSuspicious(std::string_view line) const
{
    return everything_.firstIn(line) != contract::PhraseMatcher::none;
}

std::optional<contract::LinePhrase> VerdictPhrases::meaningOf(std::string_view line) const
{
    const std::size_t first = localized_.firstIn(line);
    if (first == contract::PhraseMatcher::none)
        return std::nullopt;
    return contract::resultPhrases[first].meaning;
}

std::string kindOfProblem(std::string_view problem)
{
    std::string kind;
    for (const char c : withoutQuoted(withoutQuestion(problem)).substr(0, longestKind)) {
        if (!isDigit(c))
            kind += c;
        else if (kind.empty() || kind.back() != '#')
            kind += '#';
    }
    return kind;
}

bool ProblemLimiter::admits(std::string_view problem)
{
    const std::string kind = kindOfProblem(problem);
    const auto known = kinds_.find(kind);
    const bool isKindFull = known != kinds_.end() && known->second.shown >= shownOfKind;
    if (shown_ < shownInAll && !isKindFull) {
        ++shown_;
        ++kinds_[kind].shown;
        return true;
    }
    ++(known != kinds_.end() ? known->second.hidden : hiddenOfVariousKinds_);
    return false;
}

ProblemLimiter::Tally ProblemLimiter::tally() const
{
    Tally tally{hiddenOfVariousKinds_, kinds_.size(), hiddenOfVariousKinds_ > 0};
    for (const auto& [kind, count] : kinds_)
        tally.problems += count.shown + count.hidden;
    return tally;
}

std::vector<ProblemLimiter::Remainder> ProblemLimiter::takeRemainders()
{
    std::vector<Remainder> remainders;
    for (auto& [kind, count] : std::exchange(kinds_, {}))
        if (count.hidden > 0)
            remainders.push_back({count.hidden, kind});
    if (hiddenOfVariousKinds_ > 0)
        remainders.push_back({hiddenOfVariousKinds_, {}});
    shown_ = 0;
    hiddenOfVariousKinds_ = 0;
    return remainders;
}

using namespace std::chrono_literals;

void ProgressMeter::setRange(double from, double to)
{
    from_ = from;
    to_ = to;
}

std::optional<double> ProgressMeter::report(double percent, Clock::time_point now)
{
    double whole = std::clamp(from_ + (to_ - from_) * percent / 100, 0.1, 99.9);
    // To the module a first report of exactly 20 says that a permissions database is being read.
    if (static_cast<float>(whole) == 20.0F)
        whole = 20.05;
    if (whole - last_ < 0.1 || now - lastTime_ < 100ms)
        return std::nullopt;
    last_ = whole;
    lastTime_ = now;
    return whole;
}

std::string shownNameOf(const contract::DiskReference& disk, const VerdictPhrases& phrases)
{
    const std::string candidates[] = {
        contract::printable(disk.name),
        contract::printable(std::filesystem::path(disk.identifier).filename().string())};
    for (const std::string& name : candidates)
        if (!name.empty() && !phrases.isSuspicious(name))
            return name;
    return "volume";
}

JobLog::JobLog(const contract::DiskReference& disk, const Texts& texts, EventQueue& events)
    : texts_(texts), events_(events), phrases_(texts), diskName_(shownNameOf(disk, phrases_))
{
}

void JobLog::started()
{
    events_.add(Started{});
}

void JobLog::trace(std::string line)
{
    events_.add(Trace{std::move(line)});
}

void JobLog::step(Operation operation, const Sentence& sentence)
{
    add(Level::Step, operation == Operation::Verify ? contract::kFsckVerify : contract::kFsckRepair,
        text(sentence));
}

// A plain line brings its own line end; a dictionary's text gets one from the module.
void JobLog::detail(std::string_view line)
{
    const std::string text = contract::printable(line);
    if (phrases_.isSuspicious(text))
        add(Level::Detail, std::nullopt, text);
    else
        events_.add(Message{text + lineEnd_, {}});
}

void JobLog::problem(std::string_view line)
{
    if (problems_.admits(line))
        add(Level::Main, contract::kFsckProblem, contract::printable(line));
    else
        detail(line);
}

void JobLog::error(std::string_view text, const contract::Array& parameters)
{
    add(Level::Error, contract::kFsckError, text, parameters);
}

void JobLog::remark(std::string_view text, const contract::Array& parameters)
{
    add(Level::Main, std::nullopt, text, parameters);
}

void JobLog::failure(std::string_view text)
{
    add(Level::Main, contract::kFsckFail, text);
}

void JobLog::progress(double percentOfRun)
{
    if (const std::optional<double> percent = meter_.report(percentOfRun, Clock::now()))
        progressOfJob(*percent);
}

void JobLog::progressOfJob(double percent)
{
    events_.add(
        Message{{},
                Dictionary::of({{contract::kFsckMessageType, contract::kFsckProgress},
                                {contract::kFsckParameters, contract::Array::of({percent})}})});
}

void JobLog::endOfRun()
{
    if (found_.problems == 0)
        found_ = problems_.tally();
    for (const ProblemLimiter::Remainder& rest : problems_.takeRemainders())
        add(Level::Main, contract::kFsckProblem,
            texts_.text(rest.kind.empty() ? "… and more problems of other kinds: %1$@"
                                          : "… and %1$@ more like “%2$@”"),
            contract::Array::of({rest.count, contract::printable(rest.kind)}));
}

void JobLog::tellProblems()
{
    if (found_.problems == 0)
        return;
    const std::string_view key = found_.problems == 1 ? "1 problem was found."
                                 : found_.hasOtherKinds
                                     ? "%1$@ problems of more than %2$@ kinds were found."
                                 : found_.kinds == 1 ? "%1$@ problems of one kind were found."
                                                     : "%1$@ problems of %2$@ kinds were found.";
    error(texts_.text(key), contract::Array::of({found_.problems, found_.kinds}));
}

// The module ends a failure's line itself, a success's it does not.
void JobLog::verdict(Verdict verdict, Operation operation, bool isForGood)
{
    if (verdict == Verdict::Damaged && operation == Operation::Verify && isForGood)
        return this->verdict(false, text({"The volume “%1$@” is damaged.", diskName_, {}}));
    const auto line = verdictLineFor(verdict, operation);
    if (!line)
        return;
    const std::string said = contract::format(texts_.resultText(line->key), {diskName_});
    const bool isSuccess = line->meaning == LinePhrase::Success;
    if (phrases_.meaningOf(said) == line->meaning)
        events_.add(Message{isSuccess ? said + '\n' : said, {}});
    else  // a translation whose sentence and phrase do not agree
        this->verdict(isSuccess, said);
}

void JobLog::verdict(bool isGood, std::string_view text)
{
    add(Level::Main, isGood ? contract::kFsckSuccess : contract::kFsckError, text);
}

void JobLog::outcomeOfVolume(const Outcome& outcome, Operation operation)
{
    const std::string message = messageOf(outcome, operation, diskName_, texts_);
    const bool isUnanswered =
        outcome.verdict == Verdict::Failed || outcome.verdict == Verdict::Inconclusive;
    if (isUnanswered)
        failure(asLine(message));
    else if (!outcome.reason.isEmpty() && outcome.warnings.empty())
        remark(asLine(message));
    const bool isForGood = outcome.code == contract::kPLErrorDamagedForGood ||
                           outcome.code == contract::kPLErrorCutShort;
    verdict(outcome.verdict, operation, isForGood);
    // What a repair cost is the last word, not the success.
    for (const Sentence& warning : outcome.warnings)
        failure(asLine(messageOf({outcome.verdict, outcome.code, 0, warning, {}}, operation,
                                 diskName_, texts_)));
    finished(outcome, message);
}

void JobLog::finished(const Outcome& outcome, const std::string& message)
{
    const Name verdict = nameOf(outcome.verdict);
    trace("result: " + std::string(verdict.text()) + ": " + message);
    Dictionary result = resultOf(verdict, message);
    if (!outcome.warnings.empty())
        result.set(contract::kPLHasLosses, true);
    events_.add(Finished{outcome.code, outcome.detail, std::move(result)});
    events_.flush();
}

void JobLog::finished(contract::ErrorCode mainError, std::int32_t detailError, Name verdict,
                      const std::string& message)
{
    events_.add(Finished{mainError, detailError, resultOf(verdict, message)});
    events_.flush();
}

Dictionary JobLog::resultOf(Name verdict, const std::string& message) const
{
    Dictionary result =
        Dictionary::of({{contract::kPLVerdict, verdict}, {contract::kPLMessage, message}});
    if (!tool_.empty())
        result.set(contract::kPLTool, tool_);
    if (found_.problems > 0)
        result.set(contract::kPLProblems, found_.problems);
    if (found_.problems > 0 && !found_.hasOtherKinds)
        result.set(contract::kPLProblemKinds, found_.kinds);
    return result;
}

void JobLog::add(Level level, std::optional<Name> type, std::string_view text,
                 const contract::Array& parameters)
{
    Dictionary message = Dictionary::of({{contract::kFsckMessageString, text},
                                         {contract::kFsckVerbosity, static_cast<int>(level)}});
    if (type)
        message.set(contract::kFsckMessageType, *type);
    if (parameters)
        message.set(contract::kFsckParameters, parameters);
    events_.add(Message{{}, std::move(message)});
}

}  // namespace pellar
