// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/QtEvents.h"

#include <QGuiApplication>

namespace orvane::desktop {

std::uint64_t modifierFlags(Qt::KeyboardModifiers modifiers)
{
    std::uint64_t flags = 0;
    if (modifiers.testFlag(Qt::ShiftModifier))
        flags |= contract::modifierShift;
    if (modifiers.testFlag(Qt::ControlModifier))
        flags |= contract::modifierControl;
    if (modifiers.testFlag(Qt::AltModifier))
        flags |= contract::modifierOption;
    return flags;
}

std::uint16_t keyCodeOf(int qtKey)
{
    switch (qtKey) {
        case Qt::Key_Backspace: return contract::keyDelete;
        case Qt::Key_Delete: return contract::keyForwardDelete;
        case Qt::Key_Clear: return contract::keyKeypadClear;
        default: return otherKey;
    }
}

std::uint64_t QtEvents::currentModifierFlags() const
{
    return modifierFlags(QGuiApplication::keyboardModifiers());
}

}  // namespace orvane::desktop
