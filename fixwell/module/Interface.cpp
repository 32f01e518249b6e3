// SPDX-License-Identifier: Apache-2.0
#include "fixwell/messagelog/OVFXWMessageOutlineView.h"
#include "fixwell/module/OVFXW.h"

#include <algorithm>
#include <array>

namespace fixwell {
namespace {

struct ActionMethod {
    Selector selector;
    void (OVFXW::*method)(const void* sender);
};

constexpr std::array<ActionMethod, 9> actionMethods{{
    {"verifyDisk:", &OVFXW::verifyDisk},
    {"repairDisk:", &OVFXW::repairDisk},
    {"verifyPermissions:", &OVFXW::verifyPermissions},
    {"repairPermissions:", &OVFXW::repairPermissions},
    {"stopAction:", &OVFXW::stopAction},
    {"showDetailsAction:", &OVFXW::showDetailsAction},
    {"clearHistoryAction:", &OVFXW::clearHistoryAction},
    {"helpButtonAction:", &OVFXW::helpButtonAction},
    {"deleteSelected:", &OVFXW::deleteSelected},
}};

}  // namespace

bool OVFXW::perform(Selector selector, const void* sender)
{
    const auto found = std::find_if(
        actionMethods.begin(), actionMethods.end(),
        [selector](const ActionMethod& candidate) { return candidate.selector == selector; });
    if (found == actionMethods.end())
        return false;
    (this->*found->method)(sender);
    return true;
}

std::unique_ptr<OutlineView> OVFXW::makeOutlineView(std::string_view className,
                                                    OutlineViewPeer& peer)
{
    if (className != "OVFXWMessageOutlineView")
        return nullptr;
    return std::make_unique<OVFXWMessageOutlineView>(peer, host().generalPasteboard());
}

}  // namespace fixwell
