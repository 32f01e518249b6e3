// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/texts/TimeEstimator.h"

#include <algorithm>
#include <cmath>
#include <utility>

namespace orvane {
namespace {

constexpr double quietSeconds = 2;
constexpr double quietPercent = 1;
// A change of pace is believed by two thirds after this time.
constexpr double smoothingSeconds = 5;

long roundedTo(double step, double number)
{
    return static_cast<long>(step * std::round(number / step));
}

}  // namespace

std::string durationText(double seconds, const Translator& translator)
{
    const double minutes = seconds / 60;
    if (seconds < 50)
        return translator.text("less than a minute");
    if (minutes < 75) {
        const long shown = roundedTo(minutes < 12.5 ? 1 : 5, minutes);
        return contract::format(translator.plural("about %ld minute", "about %ld minutes", shown),
                                {shown});
    }
    if (minutes < 36 * 60) {
        const long shown = roundedTo(1, minutes / 60);
        return contract::format(translator.plural("about %ld hour", "about %ld hours", shown),
                                {shown});
    }
    const long shown = roundedTo(1, minutes / 60 / 24);
    return contract::format(translator.plural("about %ld day", "about %ld days", shown), {shown});
}

TimeEstimator::TimeEstimator(std::function<Date()> now, Translator translator)
    : now_(std::move(now)), translator_(std::move(translator)), made_(now_()), start_(made_)
{
}

void TimeEstimator::setStartTimeWithPercentComplete(Date start, double percent)
{
    start_ = std::max(start, made_);
    startPercent_ = percent;
    last_.reset();
}

std::string TimeEstimator::timeEstimateString(double percent)
{
    const Date now = now_();
    const double elapsed = Seconds(now - start_).count();
    const double progress = std::min(percent, 100.0) - startPercent_;
    const bool isTooEarly = elapsed < quietSeconds || !(progress >= quietPercent);
    if (isTooEarly || percent >= 100)
        return {};
    const double secondsLeft = elapsed * (100 - percent) / progress;
    return durationText(smoothed(secondsLeft, now), translator_);
}

// The last estimate, less the time since, drawn towards the new one.
double TimeEstimator::smoothed(double secondsLeft, Date now)
{
    if (last_) {
        const double passed = std::max(0.0, Seconds(now - last_->madeAt).count());
        const double expected = std::max(0.0, last_->secondsLeft - passed);
        const double weight = 1 - std::exp(-passed / smoothingSeconds);
        secondsLeft = expected + weight * (secondsLeft - expected);
    }
    last_ = Estimate{now, secondsLeft};
    return secondsLeft;
}

}  // namespace orvane
