// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "fixwell/host/foundation/Dictionary.h"
#include "fixwell/host/pellar/ErrorCodes.h"

#include <cstdint>
#include <string>
#include <variant>

namespace pellar {

struct Started {};

/// A plain line when there is no dictionary.
struct Message {
    std::string text;
    fixwell::Dictionary dictionary;
};

/// For the developers: a command before it runs, why a tool was chosen or refused.
struct Trace {
    std::string line;
};

struct Finished {
    fixwell::ErrorCode mainError = fixwell::kPLNoError;
    std::int32_t detailError = 0;
    fixwell::Dictionary result;
};

/// What a job tells, in the order in which it happened.
using Event = std::variant<Started, Message, Trace, Finished>;

}  // namespace pellar
