// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/StyledText.h"

#include <string>

namespace contract {

/// The text as RTF (Rich Text Format Specification 1.9.1): fonts, sizes, colours and paragraph
/// ends, every character outside ASCII as an escape. Bytes that are no UTF-8 become U+FFFD, and
/// control characters other than tab and line feed are left out.
std::string rtf(const StyledText& text);

/// The text as RTFD: the RTF and its attachments. A log has no attachments, so this is the RTF.
std::string rtfd(const StyledText& text);

}  // namespace contract
