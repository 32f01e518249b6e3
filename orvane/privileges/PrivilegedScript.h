// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/privileges/HelperProtocol.h"
#include "pellar/jobs/JobLog.h"
#include "pellar/jobs/JobOptions.h"
#include "pellar/texts/Texts.h"

#include <functional>
#include <string>
#include <vector>

namespace orvane {

class HelperProcess;

/// Told in a job's thread that the user may be asked for a password from now on, and that this is
/// over. Either may be empty.
struct Asking {
    std::function<void()> begins;
    std::function<void()> ends;
};

/// What a user of this program can do after a trial, in their language (pellar::Trials). Any may be
/// empty.
struct RepairAdvice {
    pellar::Trials::Advice undo;
    pellar::Trials::Advice undoPermissions;
    pellar::Trials::Advice apply;
    pellar::Trials::Advice repairDirectly;
};

/// How the helper is started.
struct HelperLaunch {
    /// What the helper's arguments are appended to: pkexec(1) and the helper's path.
    std::vector<std::string> launcher;
    std::string languages;
    Asking asking;
    RepairAdvice advice = {};  ///< where the helper has some to give
};

/// A job for which this user has no right to the disk: it runs in the helper, as root, when the
/// user has shown that they may, and what it tells is told here. The references outlive it.
class PrivilegedScript final : public pellar::Script {
public:
    PrivilegedScript(HelperLaunch launch, pellar::PrivilegedJob job, const pellar::Texts& texts,
                     pellar::StopSwitch& stop, pellar::EventQueue& events);

    void run() override;

private:
    void follow(HelperProcess& helper);
    void take(std::string_view lines);
    void take(pellar::Event event);
    void takeEnd(pellar::Finished end);
    std::string sentenceFor(Advice advice) const;
    bool isResult(const pellar::Event& event) const;
    void passStopOn(HelperProcess& helper);
    void explain(std::optional<int> status);
    void asked();
    void fail(contract::ErrorCode error, std::string_view reason,
              contract::Name verdict = contract::kPLVerdictFailed);

    const HelperLaunch launch_;
    const pellar::PrivilegedJob job_;  ///< its image stays open for the helper
    const HelperRequest request_;
    const pellar::Texts& texts_;
    pellar::StopSwitch& stop_;
    pellar::EventQueue& events_;
    pellar::JobLog log_;
    const pellar::VerdictPhrases guard_;
    std::vector<pellar::Event> held_;  ///< the result, and what follows it
    std::string unfinishedLine_;
    unsigned pressesTold_ = 0;
    bool isAsking_ = false;
    bool hasStarted_ = false;
    bool hasFinished_ = false;
};

}  // namespace orvane
