// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/terminal/manual/Document.h"

#include <cstddef>
#include <string>

namespace orvane::manual {

struct TextLayout {
    std::size_t columns = 80;  ///< no line is longer, but for a word or an example that is
    bool isBold = false;       ///< headings, and what is not plain, in bold (ECMA-48, 8.3.117)
};

/// The page for a terminal. It ends with a line end.
std::string plainText(const Document& page, const TextLayout& layout);

}  // namespace orvane::manual
