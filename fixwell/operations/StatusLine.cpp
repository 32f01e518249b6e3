// SPDX-License-Identifier: Apache-2.0
#include "fixwell/module/Localizable.h"
#include "fixwell/module/OVFXW.h"

namespace fixwell {
namespace {

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
