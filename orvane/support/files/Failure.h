// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/UTF8.h"
#include "pellar/outcome/Result.h"

#include <functional>
#include <string>
#include <string_view>
#include <system_error>

namespace orvane {

/// Why something could not be done: one sentence that names the attempt, the object and the
/// outcome, fit to be shown (names in it are already printable).
struct Failure {
    std::string message;

    friend bool operator==(const Failure&, const Failure&) = default;
};

using pellar::Result;

/// Where a service says, once, that it goes on with less than it should.
using WarningSink = std::function<void(const std::string& sentence)>;

/// What the system says about an error number (errno(3)).
[[nodiscard]] inline std::string errorText(int errorNumber)
{
    return std::generic_category().message(errorNumber);
}

/// "cannot ATTEMPT ‘OBJECT’: OUTCOME", with the object made printable.
[[nodiscard]] inline Failure cannot(const std::string& attempt, std::string_view object,
                                    const std::string& outcome)
{
    return {"cannot " + attempt + " ‘" + contract::printable(object) + "’: " + outcome};
}
[[nodiscard]] inline Failure cannot(const std::string& attempt, std::string_view object,
                                    int errorNumber)
{
    return cannot(attempt, object, errorText(errorNumber));
}

}  // namespace orvane
