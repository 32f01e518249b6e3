// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/support/OVPreferences.h"

#include <string_view>

namespace orvane {

/// A preference that is on or off, kept in the stored settings under its key. Main thread, as the
/// settings.
struct Switch {
    std::string_view key;
    bool isOnAtFirst = false;  ///< until the user says otherwise

    [[nodiscard]] bool isOn(const contract::UserDefaults& settings) const
    {
        const contract::Value kept = settings.objectForKey(key);
        return kept.isNone() ? isOnAtFirst : kept.boolean();
    }
    void set(contract::UserDefaults& settings, bool isOn) const
    {
        if (isOn != this->isOn(settings))
            settings.setObjectForKey(isOn, key);
    }
};

/// Archives of packages may be fetched over the network.
inline constexpr Switch fetchesPackageArchives{"fetchesPackageArchives"};
/// A verification that finds nothing tries a repair as well.
inline constexpr Switch thoroughVerification{"thoroughVerification"};
/// The user wants to be asked before a repair begins.
inline constexpr Switch asksBeforeRepair{"asksBeforeRepair", true};
/// The desktop is told of the end of a job that the user did not see.
inline constexpr Switch showsNotices{"showsNotices", true};
/// The images that were open at the end are opened at the next start.
inline constexpr Switch reopensImages{"reopensImages"};

}  // namespace orvane
