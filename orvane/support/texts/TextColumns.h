// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

namespace orvane {

// Widths on a terminal, in columns, as the locale has them (wcwidth(3)). Texts must be printable.

/// What has no width of its own counts as one column.
std::size_t columnsOf(char32_t character);
std::size_t columnsOf(std::string_view text);

/// As much of `text` as fits into `columns` columns.
std::string fittedTo(std::string_view text, std::size_t columns);

/// Where the text may be broken into lines: its pieces, each with the blanks that end it. Between
/// words there are blanks; scripts written without them break between any two characters of double
/// width, but for marks that may not begin or end a line.
std::vector<std::string_view> breakablePieces(std::string_view text);

/// The words of a text that came in several lines as one line: line ends and blanks in a row become
/// one blank, and none at all between two characters of double width.
std::string joinedLines(std::string_view text);

}  // namespace orvane
