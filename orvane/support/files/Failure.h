// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <functional>
#include <string>
#include <variant>

namespace orvane {

/// Why something could not be done: one sentence that names the attempt, the object and the
/// outcome, fit to be shown (names in it are already printable).
struct Failure {
    std::string message;

    friend bool operator==(const Failure&, const Failure&) = default;
};

struct Done {};

/// Either what was asked for, or why there is none.
template <class T = Done>
using Outcome = std::variant<T, Failure>;

template <class T>
[[nodiscard]] bool failed(const Outcome<T>& outcome)
{
    return std::holds_alternative<Failure>(outcome);
}

template <class T>
[[nodiscard]] const std::string& failureMessage(const Outcome<T>& outcome)
{
    return std::get<Failure>(outcome).message;
}

/// Where a service says, once, that it goes on with less than it should.
using WarningSink = std::function<void(const std::string& sentence)>;

/// What the system says about an error number (errno(3)).
[[nodiscard]] std::string errorText(int errorNumber);

/// "cannot ATTEMPT ‘OBJECT’: OUTCOME", with the object made printable.
[[nodiscard]] Failure cannot(std::string_view attempt, std::string_view object,
                             std::string_view outcome);
[[nodiscard]] Failure cannot(std::string_view attempt, std::string_view object, int errorNumber);

}  // namespace orvane
