// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Value.h"

#include <string_view>

namespace contract {

/// The host's preferences. Main thread only.
class OVPreferences {
public:
    virtual ~OVPreferences() = default;

    virtual bool showDetailsInFixwell() const = 0;
    virtual void setShowDetailsInFixwell(bool shows) = 0;
    /// The running system's root volume is mounted read-only, as a rescue system's is.
    virtual bool rootVolumeIsReadOnly() const = 0;
};

/// The application's stored settings. Main thread only.
class UserDefaults {
public:
    virtual ~UserDefaults() = default;

    /// What is stored under `key`, or no value. Text that spells a truth value ("NO", "false",
    /// "0", "YES", ...) comes back as a Boolean.
    virtual Value objectForKey(std::string_view key) const = 0;
    /// No value removes the key.
    virtual void setObjectForKey(const Value& value, std::string_view key) = 0;
};

}  // namespace contract
