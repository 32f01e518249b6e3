// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Value.h"

#include <concepts>
#include <initializer_list>
#include <string>
#include <string_view>
#include <variant>

namespace contract {

/// One argument of a format. Text is borrowed for the length of the call.
class FormatArgument {
public:
    FormatArgument(std::string_view text) : argument_(text) {}
    FormatArgument(const std::string& text) : argument_(std::string_view(text)) {}
    FormatArgument(const char* text) : argument_(std::string_view(text)) {}
    FormatArgument(double number) : argument_(number) {}
    template <std::integral T>
    FormatArgument(T number) : argument_(static_cast<std::int64_t>(number))
    {
    }

    std::string_view text() const;
    std::int64_t integer() const;
    double real() const;
    bool isText() const { return std::holds_alternative<std::string_view>(argument_); }
    bool isReal() const { return std::holds_alternative<double>(argument_); }

private:
    std::variant<std::string_view, std::int64_t, double> argument_;
};

/// Fills a format. It knows `%@` and `%s` (text, or a number as it is), `%d`, `%i`, `%u`,
/// `%ld`, `%lld`, `%lu` (whole numbers), `%f` and `%.Nf`, `%%`, and a position before any of
/// them (`%2$@`) for translations that change the order.
///
/// An argument is copied and never read as a format, so a disk called "%@" stays one. A
/// placeholder without an argument, or one that is not known, stays in the text as it stands.
std::string format(std::string_view text, std::initializer_list<FormatArgument> arguments);

}  // namespace contract
