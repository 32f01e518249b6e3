// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Array.h"
#include "contract/foundation/PhraseMatcher.h"
#include "contract/pellar/DiskReference.h"
#include "contract/pellar/ResultPhrases.h"
#include "pellar/jobs/EventQueue.h"
#include "pellar/outcome/Outcome.h"
#include "pellar/outcome/Task.h"
#include "pellar/process/Stopping.h"
#include "pellar/texts/Sentence.h"
#include "pellar/texts/Texts.h"

#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace pellar {

/// Knows the phrases by which the module takes a plain line for a verdict, in English and in the
/// user's language, so that nothing that comes off a disk can pass for one.
class VerdictPhrases {
public:
    explicit VerdictPhrases(const Texts& texts);

    /// The line holds a result phrase or the marker of an error, whatever the case.
    bool isSuspicious(std::string_view line) const;
    /// What the module will take the line for; none for an ordinary line.
    std::optional<contract::LinePhrase> meaningOf(std::string_view line) const;

private:
    contract::PhraseMatcher
        localized_;  ///< in the module's order, so it answers what the module does
    contract::PhraseMatcher everything_;
};

/// Keeps the brief log readable on a disk with ten thousand problems: of each kind only the first
/// few are shown as errors, the others are counted. Problems are of one kind when they differ in
/// numbers and quoted names only.
class ProblemLimiter {
public:
    static constexpr std::uint64_t shownOfKind = 10;
    static constexpr std::uint64_t shownInAll = 100;

    struct Remainder {
        std::uint64_t count;
        std::string kind;  ///< empty: of various kinds
    };

    /// How many problems there were since it started anew.
    struct Tally {
        std::uint64_t problems = 0;
        std::uint64_t kinds = 0;     ///< of those that were shown
        bool hasOtherKinds = false;  ///< and there are more than these
    };

    /// Whether this problem is to be shown; counts it otherwise.
    bool admits(std::string_view problem);
    Tally tally() const;
    /// What was not shown, by kind, and starts anew. A kind of which nothing was shown is
    /// counted with the various.
    std::vector<Remainder> takeRemainders();

private:
    struct Count {
        std::uint64_t shown = 0;
        std::uint64_t hidden = 0;
    };

    std::map<std::string, Count> kinds_;  ///< at most shownInAll: only kinds that were shown
    std::uint64_t shown_ = 0;
    std::uint64_t hiddenOfVariousKinds_ = 0;
};

/// "Inode 16 ref count is 9, should be 1.  Fix? no" → "Inode # ref count is #, should be #."
std::string kindOfProblem(std::string_view problem);

/// Turns the progress of a job's runs into reports worth sending: strictly between 0 and 100,
/// never backwards, at most ten in a second, and only when there is a tenth of a per cent to
/// tell.
class ProgressMeter {
public:
    /// The share of the whole that the coming run takes, in per cent.
    void setRange(double from, double to);
    /// `percent` of the run; none when nothing is to be sent.
    std::optional<double> report(double percent, Clock::time_point now);

private:
    double from_ = 0;
    double to_ = 100;
    double last_ = 0;
    Clock::time_point lastTime_{};
};

/// What the disk is called in messages: its name, fit to be shown; where that holds a phrase that
/// the module would take for a verdict, the end of its identifier, or just "volume".
std::string shownNameOf(const contract::DiskReference& disk, const VerdictPhrases& phrases);

/// The only writer of a job's messages: writes them in the forms that the module understands, in
/// the user's language. The job's thread. `texts` and `events` outlive it.
class JobLog {
public:
    JobLog(const contract::DiskReference& disk, const Texts& texts, EventQueue& events);

    const std::string& diskName() const { return diskName_; }
    /// The module ends a plain line itself in jobs that are not about a file system.
    void leaveLinesOpen() { lineEnd_.clear(); }

    void started();
    void trace(std::string line);
    /// A step of a verification or a repair, shown with the details.
    void step(Operation operation, const Sentence& sentence);
    /// A line of a tool that says nothing in particular.
    void detail(std::string_view line);
    void detail(const Sentence& sentence) { detail(text(sentence)); }
    /// A tool's line about a problem, or one line of many of our own. Shown as a failure, or as a
    /// detail where there are too many of its kind. An error would be a heading each.
    void problem(std::string_view line);
    void problem(const Sentence& sentence) { problem(text(sentence)); }
    /// Always shown as an error. The module puts the parameters, where there are some, in their
    /// places.
    void error(std::string_view text, const contract::Array& parameters = {});
    void error(const Sentence& sentence) { error(text(sentence)); }
    /// Always shown.
    void remark(std::string_view text, const contract::Array& parameters = {});
    void remark(const Sentence& sentence) { remark(text(sentence)); }
    /// A failure, or why the check was ended.
    void failure(std::string_view text);
    void failure(const Sentence& sentence) { failure(text(sentence)); }
    void progress(double percentOfRun);
    /// Of all of the job; to the letter, which `progress` does not promise.
    void progressOfJob(double percent);
    /// Names the number of problems that were not shown.
    void endOfRun();
    /// Says in one sentence how many problems there were in the first run that had any, and of how
    /// many kinds; nothing where there were none.
    void tellProblems();
    /// The tool that does the job's work, for the result.
    void setTool(std::string tool) { tool_ = std::move(tool); }
    const std::string& tool() const { return tool_; }
    /// The line by which the module knows the result; none for a verdict without a phrase. What is
    /// damaged for good does not “need to be repaired”.
    void verdict(Verdict verdict, Operation operation, bool isForGood = false);
    /// A line of that meaning in words of its own.
    void verdict(bool isGood, std::string_view text);
    /// The end of a job on a volume: the reason where there is one, the verdict, and *finished*.
    void outcomeOfVolume(const Outcome& outcome, Operation operation);
    void finished(const Outcome& outcome, const std::string& message);
    void finished(contract::ErrorCode mainError, std::int32_t detailError, contract::Name verdict,
                  const std::string& message);

    /// Shows now what was written so far.
    void flush() { events_.flush(); }
    /// The same when it has waited for a tenth of a second.
    void flushIfDue() { events_.flushIfDue(); }

    ProgressMeter& meter() { return meter_; }
    std::string text(const Sentence& sentence) const { return sentence.in(texts_); }
    std::string text(std::string_view key) const { return texts_.text(key); }

private:
    /// How the module shows a message: the lower, the sooner. `Error` is shown always, as a heading
    /// is.
    enum class Level { Error = -1, Main = 0, Step = 1, Detail = 2 };

    contract::Dictionary resultOf(contract::Name verdict, const std::string& message) const;

    /// Without a type when that is empty.
    void add(Level level, std::optional<contract::Name> type, std::string_view text,
             const contract::Array& parameters = {});

    const Texts& texts_;
    EventQueue& events_;
    VerdictPhrases phrases_;
    std::string diskName_;
    std::string lineEnd_ = "\n";
    ProblemLimiter problems_;
    ProblemLimiter::Tally found_;  ///< by the first run that found any
    std::string tool_;
    ProgressMeter meter_;
};

}  // namespace pellar
