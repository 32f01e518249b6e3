// SPDX-License-Identifier: Apache-2.0
#include "fixwell/jobs/ActionListEntry.h"
#include "fixwell/module/OVFXW.h"

namespace fixwell {
namespace {

// What the newer permissions tool reports first, while it reads its database.
constexpr float readingDatabasePercent = 20.0F;
constexpr std::chrono::seconds readingDatabaseTime{60};

// The share of the newer permissions tool's reports that is work: they run from 20 to 100,
// because it counts the reading of its database as the first 20.
constexpr double kestronPercent(double percent)
{
    return (percent - 20) * 100 / 80;
}

// How far a job of `total` actions is when action number `current` (from 1) stands at `percent`.
// Rounded to single precision, as the bar takes it.
constexpr double overallPercent(std::int64_t current, std::int64_t total, double percent)
{
    const auto actions = static_cast<double>(total);
    const double before = static_cast<double>(current - 1) / actions * 100;
    return static_cast<float>(before + percent * (1 / actions));
}

struct StatusPhrase {
    std::string_view plain;
    std::string_view withEstimate;
};

/// Empty for an action whose status line stays as its launcher set it.
constexpr StatusPhrase statusPhrase(std::int64_t action)
{
    switch (action) {
        case FXWActionVerifyPermissions:
            return {localizable("Verifying permissions"),
                    localizable("Verifying permissions. Estimated time: %@")};
        case FXWActionRepairPermissions:
            return {localizable("Repairing permissions"),
                    localizable("Repairing permissions. Estimated time: %@")};
        case FXWActionVerifyDisk:
            return {localizable("Verifying volume"),
                    localizable("Verifying volume. Estimated time: %@")};
        case FXWActionRepairDisk:
            return {localizable("Repairing volume"),
                    localizable("Repairing volume. Estimated time: %@")};
        default: return {};
    }
}

}  // namespace

void OVFXW::plAsyncProgressForDisk(const DiskReferencePointer& reference, bool barberPole,
                                   float percent)
{
    ov_log(
        OVLog::trace, "plAsyncProgressForDisk (%@): barberPole=%s, percent=%.1f\n",
        [&] { return identifierOf(diskController().diskWithKRDisk(reference)); },
        [&] { return host().hostBundle().localizedString(barberPole ? "Yes" : "No"); },
        static_cast<double>(percent));
    if (!(percent > 0) || !(percent < 100))
        return;
    if (_jobStarted)
        percent = rescaledForKestron(percent);
    else if (!noteFirstProgress(percent))
        return;
    if (action != FXWActionNone)
        showOverallProgress(percent);
}

/// NO when the report only says that a database is being read, and the bar is to stay as it is.
bool OVFXW::noteFirstProgress(float percent)
{
    _jobStarted = true;
    if (percent != readingDatabasePercent) {
        if (inflightItem)
            inflightItem.set(kFXW_OSVersionKey, kFXW_DISK_IS_MORLA);
        windowController().setGlobalProgressBarIndeterminate(false);
        return true;
    }
    const std::string reading = localized(localizable("\tReading permissions database."));
    appendTitleToMessageText(format("%@\n", {reading}));
    appendTitleToMessageText(
        format("%@\n", {localized(localizable(
                           "\tReading the permissions database can take several minutes.\n"))}));
    windowController().setGlobalProgressText(reading);
    if (inflightItem)
        inflightItem.set(kFXW_OSVersionKey, kFXW_DISK_IS_KESTRON);
    return false;
}

float OVFXW::rescaledForKestron(float percent)
{
    if (inflightItem.string(kFXW_OSVersionKey) != kFXW_DISK_IS_KESTRON.text())
        return percent;
    if (!inflightItem.has(kFXW_FirstKestronUpdate)) {
        inflightItem.set(kFXW_FirstKestronUpdate, kFXW_FirstKestronUpdate);
        if (totalActionsInJob == 1 && _timeEstimator)
            _timeEstimator->setStartTimeWithPercentComplete(
                host().threads().now() - readingDatabaseTime, kestronPercent(percent));
        windowController().setGlobalProgressBarIndeterminate(false);
    }
    return static_cast<float>(kestronPercent(percent));
}

void OVFXW::showOverallProgress(float percent)
{
    const double overall = overallPercent(currentJob, totalActionsInJob, percent);
    windowController().setGlobalProgressBarValue(overall);
    setActionMessageWithPercentComplete(overall);
}

void OVFXW::setActionMessage()
{
    const std::string_view phrase = statusPhrase(action).plain;
    if (!phrase.empty())
        windowController().setGlobalProgressText(localized(phrase));
}

void OVFXW::setActionMessageWithPercentComplete(double percent)
{
    const std::string estimate =
        _timeEstimator ? _timeEstimator->timeEstimateString(percent) : std::string();
    if (estimate.empty()) {
        setActionMessage();
        return;
    }
    const std::string_view phrase = statusPhrase(action).withEstimate;
    if (!phrase.empty())
        windowController().setGlobalProgressText(localizedFormat(phrase, estimate));
}

}  // namespace fixwell
