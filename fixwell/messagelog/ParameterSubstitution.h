// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Array.h"
#include "fixwell/Contract.h"

#include <functional>
#include <string>
#include <string_view>

namespace fixwell {

/// Fills "%1$@", "%2$@", ... of a library message: a string as it is, a dictionary by its first
/// value, a number through `decimal`, anything else by nothing. Every occurrence is replaced,
/// parameter after parameter; what no parameter fills stays.
std::string substitutedParameters(std::string_view text, const Array& parameters,
                                  const std::function<std::string(const Value&)>& decimal);

}  // namespace fixwell
