// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/texts/MessageFile.h"

#include <algorithm>
#include <array>
#include <cstdint>
#include <cstring>
#include <fstream>
#include <iterator>

namespace orvane {
namespace {

constexpr std::uint32_t magic = 0x950412DE;
constexpr std::uint32_t magicSwapped = 0xDE120495;
constexpr std::size_t headerSize = 28;
constexpr int deepestNesting = 50;

/// Evaluates while it reads, by the precedence of C. Any fault makes the whole none.
class PluralExpression {
public:
    PluralExpression(std::string_view text, unsigned long n) : rest_(text), n_(n) {}

    std::optional<unsigned long> value()
    {
        const unsigned long result = choice();
        skipBlanks();
        return isRight_ && rest_.empty() ? std::optional(result) : std::nullopt;
    }

private:
    struct Operator {
        std::string_view sign;
        int rank;
        unsigned long (*apply)(unsigned long, unsigned long);
    };
    // Longer signs before those that they begin with.
    static constexpr std::array operators{
        Operator{"||", 1,
                 [](auto a, auto b) {
                     return 0UL + (a != 0 || b != 0);
                 }},
        Operator{"&&", 2,
                 [](auto a, auto b) {
                     return 0UL + (a != 0 && b != 0);
                 }},
        Operator{"==", 3,
                 [](auto a, auto b) {
                     return 0UL + (a == b);
                 }},
        Operator{"!=", 3,
                 [](auto a, auto b) {
                     return 0UL + (a != b);
                 }},
        Operator{"<=", 4,
                 [](auto a, auto b) {
                     return 0UL + (a <= b);
                 }},
        Operator{">=", 4,
                 [](auto a, auto b) {
                     return 0UL + (a >= b);
                 }},
        Operator{"<", 4,
                 [](auto a, auto b) {
                     return 0UL + (a < b);
                 }},
        Operator{">", 4,
                 [](auto a, auto b) {
                     return 0UL + (a > b);
                 }},
        Operator{"+", 5,
                 [](auto a, auto b) {
                     return a + b;
                 }},
        Operator{"-", 5,
                 [](auto a, auto b) {
                     return a - b;
                 }},
        Operator{"*", 6,
                 [](auto a, auto b) {
                     return a * b;
                 }},
        Operator{"/", 6,
                 [](auto a, auto b) {
                     return b == 0 ? 0 : a / b;
                 }},
        Operator{"%", 6,
                 [](auto a, auto b) {
                     return b == 0 ? 0 : a % b;
                 }},
    };

    unsigned long choice()
    {
        if (++depth_ > deepestNesting)
            return fault();
        unsigned long result = operation(1);
        if (take("?")) {
            const unsigned long chosen = choice();
            if (!take(":"))
                return fault();
            const unsigned long other = choice();
            result = result != 0 ? chosen : other;
        }
        --depth_;
        return result;
    }

    unsigned long operation(int lowest)
    {
        unsigned long result = operand();
        while (const Operator* const found = nextOperator(lowest)) {
            rest_.remove_prefix(found->sign.size());
            result = found->apply(result, operation(found->rank + 1));
        }
        return result;
    }

    unsigned long operand()
    {
        bool isNegated = false;
        while (take("!"))
            isNegated = !isNegated;
        const unsigned long result = simple();
        return isNegated ? 0UL + (result == 0) : result;
    }

    unsigned long simple()
    {
        if (take("n"))
            return n_;
        if (take("(")) {
            const unsigned long result = choice();
            return take(")") ? result : fault();
        }
        const std::size_t digits = std::min(rest_.find_first_not_of("0123456789"), rest_.size());
        if (digits == 0 || digits > 9)
            return fault();
        const unsigned long result = std::stoul(std::string(rest_.substr(0, digits)));
        rest_.remove_prefix(digits);
        return result;
    }

    const Operator* nextOperator(int lowest)
    {
        skipBlanks();
        const auto found =
            std::find_if(operators.begin(), operators.end(),
                         [this](const Operator& o) { return rest_.starts_with(o.sign); });
        return isRight_ && found != operators.end() && found->rank >= lowest ? &*found : nullptr;
    }

    bool take(std::string_view sign)
    {
        skipBlanks();
        if (!isRight_ || !rest_.starts_with(sign))
            return false;
        rest_.remove_prefix(sign.size());
        return true;
    }

    void skipBlanks()
    {
        rest_.remove_prefix(std::min(rest_.find_first_not_of(" \t"), rest_.size()));
    }

    unsigned long fault()
    {
        isRight_ = false;
        return 0;
    }

    std::string_view rest_;
    unsigned long n_;
    int depth_ = 0;
    bool isRight_ = true;
};

/// "nplurals=2; plural=n != 1;" in the catalogue's header.
std::string pluralRuleIn(std::string_view header)
{
    constexpr std::string_view field = "plural=";
    const std::size_t line = header.find("Plural-Forms:");
    const std::size_t start = line == std::string_view::npos ? line : header.find(field, line);
    if (start == std::string_view::npos)
        return "n != 1";
    header.remove_prefix(start + field.size());
    return std::string(header.substr(0, header.find_first_of(";\n")));
}

}  // namespace

std::optional<unsigned long> pluralForm(std::string_view rule, unsigned long n)
{
    return PluralExpression(rule, n).value();
}

std::optional<MessageFile> MessageFile::read(const std::filesystem::path& file)
{
    std::ifstream stream(file, std::ios::binary);
    MessageFile result(std::string(std::istreambuf_iterator<char>(stream), {}));
    if (!stream || result.bytes_.size() < headerSize)
        return std::nullopt;
    result.isSwapped_ = result.number(0) == magicSwapped;
    // The revision's upper half changes with the format.
    if (result.number(0) != magic || result.number(4) >> 16U > 1)
        return std::nullopt;
    result.count_ = result.number(8);
    result.keys_ = result.number(12);
    result.texts_ = result.number(16);
    result.plural_ = pluralRuleIn(result.translation("").value_or(""));
    return result;
}

std::uint32_t MessageFile::number(std::size_t offset) const
{
    std::uint32_t value = 0;
    if (offset > bytes_.size() || bytes_.size() - offset < sizeof value)
        return 0;
    std::memcpy(&value, bytes_.data() + offset, sizeof value);
    return isSwapped_ ? __builtin_bswap32(value) : value;
}

std::string_view MessageFile::entry(std::size_t table, std::uint32_t n) const
{
    const std::size_t descriptor = table + std::size_t{8} * n;
    const std::uint32_t length = number(descriptor);
    const std::uint32_t offset = number(descriptor + 4);
    const bool isInside = offset <= bytes_.size() && length <= bytes_.size() - offset;
    return isInside ? std::string_view(bytes_).substr(offset, length) : std::string_view();
}

// The keys are sorted. One with a plural form has that behind a zero.
std::optional<std::string_view> MessageFile::translation(std::string_view key) const
{
    std::uint32_t first = 0;
    std::uint32_t last = count_;
    while (first < last) {
        const std::uint32_t middle = first + (last - first) / 2;
        const std::string_view whole = entry(keys_, middle);
        const int order = whole.substr(0, whole.find('\0')).compare(key);
        if (order == 0)
            return entry(texts_, middle);
        (order < 0 ? first : last) = order < 0 ? middle + 1 : middle;
    }
    return std::nullopt;
}

std::optional<std::string_view> MessageFile::find(std::string_view key) const
{
    const auto found = key.empty() ? std::nullopt : translation(key);
    if (!found || found->empty())
        return std::nullopt;
    return found->substr(0, found->find('\0'));
}

std::optional<std::string_view> MessageFile::findPlural(std::string_view one,
                                                        unsigned long count) const
{
    const auto found = one.empty() ? std::nullopt : translation(one);
    if (!found || found->empty())
        return std::nullopt;
    std::string_view forms = *found;
    for (unsigned long form = pluralForm(plural_, count).value_or(0); form > 0; --form) {
        const std::size_t end = forms.find('\0');
        if (end == std::string_view::npos)
            break;
        forms.remove_prefix(end + 1);
    }
    return forms.substr(0, forms.find('\0'));
}

}  // namespace orvane
