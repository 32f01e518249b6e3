// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Dictionary.h"
#include "contract/pellar/ErrorCodes.h"

#include <cstdint>
#include <string>
#include <variant>

namespace pellar {

struct Started {};

/// A plain line when there is no dictionary.
struct Message {
    std::string text;
    contract::Dictionary dictionary;
};

/// For the developers: a command before it runs, why a tool was chosen or refused.
struct Trace {
    std::string line;
};

struct Finished {
    contract::ErrorCode mainError = contract::kPLNoError;
    std::int32_t detailError = 0;
    contract::Dictionary result;
};

/// What a job tells, in the order in which it happened.
using Event = std::variant<Started, Message, Trace, Finished>;

}  // namespace pellar
