// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QIcon>
#include <QPalette>

namespace orvane::desktop {

/// The signs of the window's commands: one set, drawn in strokes of one width.
enum class Symbol {
    Verify,
    Repair,
    Preview,
    Undo,
    Finish,
    Stop,
    Open,
    Close,
    Search,
    Report,
    Copy,
    Settings
};

/// Sharp in any size, and in the palette's colour for `role`, also when the palette changes.
[[nodiscard]] QIcon symbol(Symbol symbol, QPalette::ColorRole role = QPalette::ButtonText);

}  // namespace orvane::desktop
