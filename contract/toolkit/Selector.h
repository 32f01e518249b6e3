// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string_view>

namespace contract {

/// The name of an action that a control sends, "verifyDisk:". A literal: it is not copied.
using Selector = std::string_view;

}  // namespace contract
