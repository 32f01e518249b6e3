// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/support/OVWindowController.h"
#include "orvane/support/texts/Catalogue.h"

#include <functional>
#include <optional>

namespace orvane {

/// A duration as people say it: "less than a minute", "about 2 minutes", "about 3 hours".
/// Rounded coarser the longer it is, so that it does not flicker.
[[nodiscard]] std::string durationText(double seconds, const Translator& translator);

/// Estimates what is left of a job from what it took so far. Says nothing in the first two seconds
/// and below one percent, where any number would be a guess. A burst or a pause of progress moves
/// the estimate slowly.
class TimeEstimator final : public contract::OVTimeEstimator {
public:
    using Date = contract::Threads::Date;

    TimeEstimator(std::function<Date()> now, Translator translator);

    void setStartTimeWithPercentComplete(Date start, double percent) override;
    std::string timeEstimateString(double percent) override;

private:
    using Seconds = std::chrono::duration<double>;

    double smoothed(double secondsLeft, Date now);

    std::function<Date()> now_;
    Translator translator_;
    Date made_;  ///< the job has not run for longer, whatever start it is given
    Date start_;
    double startPercent_ = 0;

    struct Estimate {
        Date madeAt;
        double secondsLeft;
    };
    std::optional<Estimate> last_;
};

}  // namespace orvane
