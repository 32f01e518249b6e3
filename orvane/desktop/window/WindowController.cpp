// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/window/WindowController.h"

namespace orvane::desktop {

// Every disk stands in the list once, so there is nothing to filter.
std::vector<contract::OVDiskPointer> WindowController::allSelectedItemsFilterDuplicates(
    bool /*flag*/, bool /*filtersDuplicates*/)
{
    if (!selection_.empty())
        return selection_;
    const auto disks = window_.disks().selectedDisks();
    return {disks.begin(), disks.end()};
}

void WindowController::setLocked(bool isLocked)
{
    isLocked_ = isLocked;
    if (events_.lockChanged)
        events_.lockChanged(isLocked);
}

void WindowController::activateGlobalProgressBar(bool isActive)
{
    window_.progress().setBarActive(isActive);
}

void WindowController::activateGlobalProgressText(bool isActive)
{
    window_.progress().setTextActive(isActive);
}

void WindowController::setGlobalProgressBarIndeterminate(bool isIndeterminate)
{
    window_.progress().setIndeterminate(isIndeterminate);
}

void WindowController::setGlobalProgressBarValue(double percent)
{
    window_.progress().setPercent(percent);
}

void WindowController::setGlobalProgressText(std::string_view text)
{
    window_.progress().setText(events_.statusText ? events_.statusText(text) : std::string(text));
}

void WindowController::notifyWindowOfCompletion(const contract::Dictionary& report)
{
    if (events_.completed)
        events_.completed(report);
}

}  // namespace orvane::desktop
