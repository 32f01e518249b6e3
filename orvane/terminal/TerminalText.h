// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/StyledText.h"
#include "orvane/support/texts/TextColumns.h"

#include <chrono>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace orvane {

/// `text` with its line feeds and tabs, and nothing else that a terminal would obey.
std::string safeLines(std::string_view text);

/// The text with its look as SGR sequences (ECMA-48, 8.3.117): bold, and red and green for what
/// leans that way; without `colors`, the characters alone. Hostile text is made harmless.
std::string terminalText(const contract::StyledText& text, bool colors);

/// One word of a POSIX shell's command line that stands for the text, quoted where it has to be,
/// and fit to be shown: one with control characters cannot be copied from there, but does no harm.
std::string shellWord(std::string_view text);

/// How far a job is, as the bottom line of a terminal shows it.
struct JobProgress {
    std::optional<double> percent;  ///< none while there is no telling
    std::string status;
    std::chrono::seconds elapsed{0};
};

/// One line of at most `columns` columns: a bar and the percentage, or a moving mark and the time
/// gone by, and the status text.
std::string progressLine(const JobProgress& progress, std::size_t columns);

}  // namespace orvane
