// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "fixwell/Contract.h"

#include <string_view>

namespace fixwell {

/// Marks a text as a key of the module's default string table, for the tool that collects them;
/// it is looked up where it is shown.
constexpr std::string_view localizable(std::string_view text)
{
    return text;
}

}  // namespace fixwell
