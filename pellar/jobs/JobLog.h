// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/pellar/DiskReference.h"
#include "pellar/jobs/EventRoad.h"
#include "pellar/jobs/LineGuard.h"
#include "pellar/jobs/ProblemLimiter.h"
#include "pellar/jobs/ProgressMeter.h"
#include "pellar/texts/Sentence.h"
#include "pellar/outcome/Judgement.h"

#include <string>
#include <string_view>

namespace pellar {

/// What the disk is called in messages: its name, fit to be shown; where that holds a phrase that
/// the module would take for a verdict, the end of its identifier, or just "volume".
std::string shownNameOf(const contract::DiskReference& disk, const LineGuard& guard);

/// Writes a job's messages in the forms that the module understands, in the user's language. The
/// job's thread. `texts` and `road` outlive it.
class JobLog {
public:
    JobLog(const contract::DiskReference& disk, const Texts& texts, EventRoad& road);

    const std::string& diskName() const { return diskName_; }
    /// The module ends a plain line itself in jobs that are not about a file system.
    void leaveLinesOpen() { lineEnd_.clear(); }

    void started();
    void trace(std::string line);
    /// A step, shown with the details. `type`: kFsckVerify or kFsckRepair.
    void step(contract::Name type, std::string_view text);
    /// A line of a tool that says nothing in particular.
    void detail(std::string_view line);
    /// Shown as an error, or as a detail where there are too many of its kind.
    void problem(std::string_view line);
    /// Always shown as an error.
    void error(const Sentence& sentence);
    /// Always shown.
    void remark(std::string_view text);
    /// A failure, or why the check was ended.
    void failure(std::string_view text);
    void progress(double percentOfRun);
    /// Names the number of problems that were not shown.
    void endOfRun();
    /// The line by which the module knows the result; none for a verdict without a phrase. What is
    /// damaged for good does not “need to be repaired”.
    void verdict(Verdict verdict, Access access, bool isForGood = false);
    void finished(contract::ErrorCode mainError, std::int32_t detailError, contract::Name verdict,
                  const std::string& message);

    /// Shows now what was written so far.
    void flush() { road_.flush(); }

    ProgressMeter& meter() { return meter_; }
    std::string text(const Sentence& sentence) const { return sentence.in(texts_); }
    std::string text(std::string_view key) const { return texts_.text(key); }

private:
    void add(contract::Dictionary dictionary);

    const Texts& texts_;
    EventRoad& road_;
    LineGuard guard_;
    std::string diskName_;
    std::string lineEnd_ = "\n";
    ProblemLimiter problems_;
    ProgressMeter meter_;
};

}  // namespace pellar
