// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Value.h"

#include <string_view>

namespace contract {

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
