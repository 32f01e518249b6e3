// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Node.h"

#include <cstdint>
#include <string_view>

namespace contract {

/// A string constant that is stored once and compared by address: the key of a dictionary
/// entry, a message type, the name of a notification.
///
/// The host and each module intern into a table of their own, because a module links nothing of
/// the host's; names from two tables are still equal when their texts are. A name is never
/// freed, and its text is valid for the life of the process (a loaded module is never unloaded).
/// Interning takes a lock; making names is for start-up and for keys read from outside, and any
/// thread may do it.
class Name {
public:
    explicit Name(std::string_view text);

    std::string_view text() const noexcept;

    /// Equal for certain; names from two tables may be equal all the same.
    bool isSameNode(Name other) const noexcept { return node_ == other.node_; }
    friend bool operator==(Name a, Name b) noexcept { return a.node_ == b.node_ || sameText(a, b); }

private:
    friend class Value;
    struct Interned;
    struct Table;

    static bool sameText(Name a, Name b) noexcept;

    Interned* node_;
};

}  // namespace contract
