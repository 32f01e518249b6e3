// SPDX-License-Identifier: Apache-2.0
#include "contract/foundation/Format.h"

#include <algorithm>
#include <charconv>
#include <cstdio>
#include <optional>

namespace contract {
namespace {

/// One placeholder, cut out of the format.
struct Placeholder {
    std::size_t length = 0;               ///< bytes from the percent sign on
    std::optional<std::size_t> position;  ///< 1-based, when the format names one
    std::optional<int> precision;
    char conversion = 0;
};

std::optional<Placeholder> placeholderAt(std::string_view text)
{
    Placeholder placeholder;
    std::size_t at = 1;
    const auto number = [&]() -> std::optional<int> {
        int value = 0;
        const auto [end, error] =
            std::from_chars(text.data() + at, text.data() + text.size(), value);
        if (error != std::errc())
            return std::nullopt;
        at = static_cast<std::size_t>(end - text.data());
        return value;
    };
    if (const std::size_t before = at; const auto position = number()) {
        if (at < text.size() && text[at] == '$' && *position > 0) {
            placeholder.position = static_cast<std::size_t>(*position);
            ++at;
        } else {
            at = before;
        }
    }
    if (at < text.size() && text[at] == '.') {
        ++at;
        placeholder.precision = number();
    }
    while (at < text.size() && text[at] == 'l')
        ++at;
    if (at >= text.size())
        return std::nullopt;
    placeholder.conversion = text[at];
    placeholder.length = at + 1;
    return placeholder;
}

std::string decimals(double number, int precision)
{
    char digits[512];
    const int length =
        std::snprintf(digits, sizeof digits, "%.*f", std::clamp(precision, 0, 100), number);
    return {digits, static_cast<std::size_t>(std::clamp(length, 0, 511))};
}

bool append(std::string& result, const Placeholder& placeholder, const FormatArgument& argument)
{
    switch (placeholder.conversion) {
        case '@':
        case 's':
            if (argument.isText())
                result += argument.text();
            else if (argument.isReal())
                result += Value(argument.real()).description();
            else
                result += std::to_string(argument.integer());
            return true;
        case 'd':
        case 'i':
        case 'u': result += std::to_string(argument.integer()); return true;
        case 'f':
            result += decimals(argument.real(), placeholder.precision.value_or(6));
            return true;
        default: return false;
    }
}

}  // namespace

std::string_view FormatArgument::text() const
{
    return isText() ? std::get<std::string_view>(argument_) : std::string_view();
}

std::int64_t FormatArgument::integer() const
{
    if (const auto* number = std::get_if<std::int64_t>(&argument_))
        return *number;
    return isReal() ? static_cast<std::int64_t>(std::get<double>(argument_)) : 0;
}

double FormatArgument::real() const
{
    return isReal() ? std::get<double>(argument_) : static_cast<double>(integer());
}

std::string format(std::string_view text, std::initializer_list<FormatArgument> arguments)
{
    std::string result;
    result.reserve(text.size() + 32 * arguments.size());
    std::size_t next = 0;
    while (!text.empty()) {
        const std::size_t percent = std::min(text.find('%'), text.size());
        result += text.substr(0, percent);
        text.remove_prefix(percent);
        if (text.empty())
            break;
        const auto placeholder = placeholderAt(text);
        if (!placeholder) {
            result += text;
            break;
        }
        if (placeholder->conversion == '%' && placeholder->length == 2) {
            result += '%';
        } else {
            const std::size_t index = placeholder->position ? *placeholder->position - 1 : next;
            const bool isFilled =
                index < arguments.size() && append(result, *placeholder, arguments.begin()[index]);
            if (!isFilled)
                result += text.substr(0, placeholder->length);
            else if (!placeholder->position)
                ++next;
        }
        text.remove_prefix(placeholder->length);
    }
    return result;
}

}  // namespace contract
