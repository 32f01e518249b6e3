// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/outcome/Result.h"

#include <functional>
#include <string>
#include <string_view>

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
[[nodiscard]] std::string errorText(int errorNumber);

/// "cannot ATTEMPT ‘OBJECT’: OUTCOME", with the object made printable.
[[nodiscard]] Failure cannot(std::string_view attempt, std::string_view object,
                             std::string_view outcome);
[[nodiscard]] Failure cannot(std::string_view attempt, std::string_view object, int errorNumber);

}  // namespace orvane
