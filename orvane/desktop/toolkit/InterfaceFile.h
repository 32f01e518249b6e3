// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Bundle.h"

#include <QString>
#include <QWidget>

#include <filesystem>
#include <memory>

namespace orvane::desktop {

/// Dynamic properties of the widgets of an interface file.
inline constexpr const char* actionProperty = "action";        ///< of buttons, in the file
inline constexpr const char* emptyNoteProperty = "emptyNote";  ///< of a LogTable, in the file
inline constexpr const char* problemProperty = "problemWord";  ///< likewise: spoken for a red row
inline constexpr const char* successProperty = "successWord";  ///< likewise: for a green one
inline constexpr const char* viewClassProperty = "viewClass";  ///< of a LogTable, set by the loader

/// Makes the widgets of a file of Qt Designer, with their texts as the bundle translates them. A
/// custom widget class of a name that Qt does not know becomes a LogTable. None when the file
/// cannot be read; then `error` says why.
[[nodiscard]] std::unique_ptr<QWidget> loadInterfaceFile(const std::filesystem::path& file,
                                                         const contract::Bundle& texts,
                                                         QString& error);

}  // namespace orvane::desktop
