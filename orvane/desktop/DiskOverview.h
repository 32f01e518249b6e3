// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/DiskPane.h"
#include "orvane/desktop/ModuleTabs.h"
#include "orvane/desktop/RepairChoices.h"
#include "orvane/desktop/RepairUndoing.h"
#include "orvane/desktop/window/ResultSummary.h"

#include <QTimer>

#include <functional>
#include <string>
#include <string_view>
#include <vector>

namespace orvane::desktop {

/// What stands above the tabs: the header of the selected disks, and the banner with what came out
/// of the last job on them and what can be done next. Main thread.
class DiskOverview {
public:
    /// All outlive this object.
    DiskOverview(const SessionParts& parts, DiskPane& disks, const KeptRepairs& kept,
                 RepairChoices& choices, RepairUndoing& undoing);
    DiskOverview(const DiskOverview&) = delete;
    DiskOverview& operator=(const DiskOverview&) = delete;

    /// Looks at what is selected, and what is known of it, once the present event is over; often
    /// asked for and done once.
    void refresh();

    /// How the selected disk is copied, before anything else is done to it.
    void explainCopying();

private:
    void showSelection();
    ResultSummary result(const std::vector<DiskRow>& rows);
    void take(NextStep step);
    void select(const std::string& identifier);
    void showProblems();
    std::string text(std::string_view key) const { return at_.host.translator().text(key); }

    const SessionParts at_;
    DiskPane& disks_;
    const KeptRepairs& kept_;
    RepairChoices& choices_;
    RepairUndoing& undoing_;
    bool isAwaited_ = false;
    QTimer clock_;  ///< the ages that are shown grow
};

}  // namespace orvane::desktop
