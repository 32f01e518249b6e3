// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/StyledText.h"

#include <string>
#include <string_view>

namespace orvane {

/// `text` with its line feeds and tabs, and nothing else that a terminal would obey.
std::string safeLines(std::string_view text);

/// The text with its look as SGR sequences (ECMA-48, 8.3.117): bold, and red and green for what
/// leans that way; without `colors`, the characters alone. Hostile text is made harmless.
std::string terminalText(const contract::StyledText& text, bool colors);

/// As much of `text`, which must be printable, as fits into `columns` columns.
std::string fittedTo(std::string_view text, std::size_t columns);

}  // namespace orvane
