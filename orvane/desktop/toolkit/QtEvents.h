// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/toolkit/Event.h"

#include <Qt>

namespace orvane::desktop {

std::uint64_t modifierFlags(Qt::KeyboardModifiers modifiers);
/// The module's code for a key; `otherKey` for those that modules do not tell apart.
std::uint16_t keyCodeOf(int qtKey);
inline constexpr std::uint16_t otherKey = 0xFFFF;

/// The keys that are held down now.
class QtEvents final : public contract::Events {
public:
    std::uint64_t currentModifierFlags() const override;
};

}  // namespace orvane::desktop
