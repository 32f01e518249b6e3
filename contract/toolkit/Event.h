// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/toolkit/Control.h"

#include <cstdint>

namespace contract {

/// The bits of an event's modifier flags.
inline constexpr std::uint64_t modifierShift = 1U << 17U;
inline constexpr std::uint64_t modifierControl = 1U << 18U;
inline constexpr std::uint64_t modifierOption = 1U << 19U;  ///< the Alt key

// Hardware-independent key codes that the module knows.
inline constexpr std::uint16_t keyDelete = 51;
inline constexpr std::uint16_t keyForwardDelete = 117;
inline constexpr std::uint16_t keyKeypadClear = 71;

struct KeyEvent {
    std::uint16_t keyCode = 0;
    std::uint64_t modifiers = 0;
    /// The front end's own event, for the view's ordinary handling; opaque to the module.
    void* native = nullptr;
};

/// A menu item as a view sees it when it is asked whether the item is available.
struct MenuItem {
    Selector action;
};

/// What the user did last.
class Events {
public:
    virtual ~Events() = default;

    virtual std::uint64_t currentModifierFlags() const = 0;
};

}  // namespace contract
