// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/terminal/manual/Document.h"

#include <string>

namespace orvane::manual {

/// The first lines of a page of the manual (man(7), TH and NAME).
struct ManPageHead {
    std::string name;     ///< "fixwell"
    std::string section;  ///< "1"
    std::string purpose;  ///< half a sentence, after the name
    std::string version;  ///< "Orvane 0.1.0"
    std::string date;     ///< "2026-11-22": of the version, so that every build makes the same page
};

/// The page in man(7)'s macros, in ASCII; headings become sections, in capitals.
std::string manPage(const ManPageHead& head, const Document& page);

}  // namespace orvane::manual
