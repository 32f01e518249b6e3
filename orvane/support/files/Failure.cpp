// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/files/Failure.h"

#include "contract/foundation/UTF8.h"

#include <fmt/format.h>
#include <system_error>

namespace orvane {

std::string errorText(int errorNumber)
{
    return std::generic_category().message(errorNumber);
}

Failure cannot(std::string_view attempt, std::string_view object, std::string_view outcome)
{
    return {fmt::format("cannot {} ‘{}’: {}", attempt, contract::printable(object), outcome)};
}

Failure cannot(std::string_view attempt, std::string_view object, int errorNumber)
{
    return cannot(attempt, object, errorText(errorNumber));
}

}  // namespace orvane
