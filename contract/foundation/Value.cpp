// SPDX-License-Identifier: Apache-2.0
#include "contract/foundation/Value.h"

#include "contract/foundation/Storage.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <cmath>
#include <limits>

namespace contract {
namespace {

// Verbosities, flags and percentages: numbers that stand in almost every record.
constexpr std::int64_t smallest = -2;
constexpr std::int64_t largest = 100;

NumberNode* sharedInteger(std::int64_t number)
{
    static NumberNode** const nodes = [] {
        auto** made = new NumberNode*[largest - smallest + 1];
        for (std::int64_t n = smallest; n <= largest; ++n)
            made[n - smallest] = new NumberNode(Kind::Integer, n, Node::immortal);
        return made;
    }();
    return nodes[number - smallest];
}

NumberNode* sharedBoolean(bool flag)
{
    static NumberNode* const no = new NumberNode(Kind::Boolean, 0, Node::immortal);
    static NumberNode* const yes = new NumberNode(Kind::Boolean, 1, Node::immortal);
    return flag ? yes : no;
}

template <class T>
T& as(const NodePointer<Node>& node)
{
    return static_cast<T&>(*node);
}

std::string describe(double number)
{
    std::array<char, 32> digits;
    const auto end = std::to_chars(digits.data(), digits.data() + digits.size(), number).ptr;
    return {digits.data(), end};
}

template <class Items, class Describe>
std::string describeAll(char open, char close, const Items& items, Describe&& describeOne)
{
    std::string text(1, open);
    for (const auto& item : items) {
        if (text.size() > 1)
            text += ", ";
        describeOne(text, item);
    }
    return text += close;
}

bool sameEntries(const Dictionary& a, const Dictionary& b)
{
    return a.size() == b.size() && std::all_of(a.entries().begin(), a.entries().end(),
                                               [&b](const Dictionary::Entry& entry) {
                                                   return b[entry.key] == entry.value;
                                               });
}

}  // namespace

Value::Value(bool flag) noexcept : node_(NodePointer<Node>::adopting(sharedBoolean(flag))) {}

Value::Value(double number) : node_(NodePointer<Node>::adopting(new NumberNode(number))) {}

Value::Value(Name name) noexcept : node_(NodePointer<Node>::adopting(name.node_)) {}

Value::Value(std::string_view text) : node_(NodePointer<Node>::adopting(new StringNode(text))) {}

Value::Value(const Array& array) noexcept : node_(array.node_) {}

Value::Value(const Dictionary& dictionary) noexcept : node_(dictionary.node_) {}

Value::Value(const StyledText& text) noexcept : node_(text.node_) {}

Value Value::fromInteger(std::int64_t number)
{
    if (number >= smallest && number <= largest)
        return Value(NodePointer<Node>::adopting(sharedInteger(number)));
    return Value(NodePointer<Node>::adopting(new NumberNode(Kind::Integer, number)));
}

Value Value::fromObject(std::shared_ptr<Object> object)
{
    if (!object)
        return {};
    return Value(NodePointer<Node>::adopting(new ObjectNode(std::move(object))));
}

bool Value::isNumber() const noexcept
{
    return kind() == Kind::Boolean || kind() == Kind::Integer || kind() == Kind::Real;
}

// Beyond the range of the type a conversion has no defined result.
static std::int64_t nearestInteger(double real) noexcept
{
    constexpr double limit = 9223372036854775808.0;  // 2^63
    if (std::isnan(real))
        return 0;
    if (real >= limit)
        return std::numeric_limits<std::int64_t>::max();
    return real < -limit ? std::numeric_limits<std::int64_t>::min()
                         : static_cast<std::int64_t>(real);
}

std::int64_t Value::integer() const noexcept
{
    switch (kind()) {
        case Kind::Boolean:
        case Kind::Integer: return as<NumberNode>(node_).integer;
        case Kind::Real: return nearestInteger(as<NumberNode>(node_).real);
        default: return 0;
    }
}

double Value::real() const noexcept
{
    return kind() == Kind::Real ? as<NumberNode>(node_).real : static_cast<double>(integer());
}

std::string_view Value::string() const noexcept
{
    return kind() == Kind::String ? std::string_view(as<StringNode>(node_).text)
                                  : std::string_view();
}

Array Value::array() const noexcept
{
    if (kind() != Kind::Array)
        return {};
    return Array(node_);
}

Dictionary Value::dictionary() const noexcept
{
    if (kind() != Kind::Dictionary)
        return {};
    return Dictionary(node_);
}

StyledText Value::styledText() const noexcept
{
    if (kind() != Kind::StyledText)
        return {};
    return StyledText(node_);
}

std::shared_ptr<Object> Value::object() const noexcept
{
    return kind() == Kind::Object ? as<ObjectNode>(node_).object : nullptr;
}

std::string Value::description() const
{
    switch (kind()) {
        case Kind::None: return "(none)";
        case Kind::Boolean: return boolean() ? "YES" : "NO";
        case Kind::Integer: return std::to_string(integer());
        case Kind::Real: return describe(real());
        case Kind::String: return std::string(string());
        case Kind::StyledText: return std::string(styledText().characters());
        case Kind::Object: return object()->description();
        case Kind::Array:
            return describeAll(
                '(', ')', array().values(),
                [](std::string& text, const Value& value) { text += value.description(); });
        case Kind::Dictionary:
            return describeAll('{', '}', dictionary().entries(),
                               [](std::string& text, const Dictionary::Entry& entry) {
                                   text.append(entry.key.text()).append(" = ");
                                   text += entry.value.description();
                               });
    }
    return {};
}

bool operator==(const Value& a, const Value& b) noexcept
{
    if (a.node_.get() == b.node_.get())
        return true;
    if (a.isNumber() && b.isNumber())
        return a.real() == b.real() && a.integer() == b.integer();
    if (a.kind() != b.kind())
        return false;
    switch (a.kind()) {
        case Kind::String: return a.string() == b.string();
        case Kind::Array: return a.array().values() == b.array().values();
        case Kind::Dictionary: return sameEntries(a.dictionary(), b.dictionary());
        case Kind::StyledText: return a.styledText().characters() == b.styledText().characters();
        case Kind::Object: return a.object()->isEqual(*b.object());
        default: return false;
    }
}

void Node::destroy(Node* node) noexcept
{
    switch (node->kind) {
        case Kind::None: break;
        case Kind::Boolean:
        case Kind::Integer:
        case Kind::Real: delete static_cast<NumberNode*>(node); break;
        case Kind::String: delete static_cast<StringNode*>(node); break;
        case Kind::Array: delete static_cast<Array::Storage*>(node); break;
        case Kind::Dictionary: delete static_cast<Dictionary::Storage*>(node); break;
        case Kind::StyledText:
            StyledText::Storage::destroy(static_cast<StyledText::Storage*>(node));
            break;
        case Kind::Object: delete static_cast<ObjectNode*>(node); break;
    }
}

}  // namespace contract
