// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Name.h"
#include "contract/foundation/Node.h"

#include <concepts>
#include <cstdint>
#include <memory>
#include <string>
#include <string_view>

namespace contract {

class Array;
class Dictionary;
class StyledText;

/// Something with an identity of its own that travels in dictionaries and notifications.
class Object {
public:
    Object() = default;
    Object(const Object&) = delete;
    Object& operator=(const Object&) = delete;
    virtual ~Object() = default;

    /// "Equal by the object's own equality test"; identity unless a class knows better.
    virtual bool isEqual(const Object& other) const { return this == &other; }
    /// What a log line shows for the object.
    virtual std::string description() const { return "object"; }
};

/// Anything that a record can hold under a key, or nothing. One pointer in size; copies share.
///
/// Reading never fails: a question that does not fit the kind answers the neutral value (0, NO,
/// the empty string, no object), as a missing entry does.
class Value {
public:
    Value() noexcept = default;
    Value(bool flag) noexcept;
    Value(double number);
    /// An interned name reads as the string it stands for and costs no storage.
    Value(Name name) noexcept;
    Value(std::string_view text);
    Value(const std::string& text) : Value(std::string_view(text)) {}
    Value(const char* text) : Value(std::string_view(text)) {}
    Value(const Array& array) noexcept;
    Value(const Dictionary& dictionary) noexcept;
    Value(const StyledText& text) noexcept;
    template <std::integral T>
    requires(!std::same_as<T, bool>) Value(T number)
        : Value(fromInteger(static_cast<std::int64_t>(number)))
    {
    }
    /// A null pointer gives no value.
    template <std::derived_from<Object> T>
    Value(const std::shared_ptr<T>& object) : Value(fromObject(object))
    {
    }

    Kind kind() const noexcept { return node_ ? node_->kind : Kind::None; }
    bool isNone() const noexcept { return !node_; }
    explicit operator bool() const noexcept { return !isNone(); }
    bool isNumber() const noexcept;

    bool boolean() const noexcept { return integer() != 0; }
    /// A real number is cut towards zero.
    std::int64_t integer() const noexcept;
    double real() const noexcept;
    /// Valid as long as some value shares this string.
    std::string_view string() const noexcept;
    Array array() const noexcept;
    Dictionary dictionary() const noexcept;
    StyledText styledText() const noexcept;
    std::shared_ptr<Object> object() const noexcept;
    template <std::derived_from<Object> T>
    std::shared_ptr<T> object() const noexcept
    {
        return std::dynamic_pointer_cast<T>(object());
    }

    /// One line for a log: strings as they are, containers with their contents.
    std::string description() const;

    /// Equal contents; two objects are equal by their own test, styled texts by their characters.
    friend bool operator==(const Value& a, const Value& b) noexcept;

private:
    static Value fromInteger(std::int64_t number);
    static Value fromObject(std::shared_ptr<Object> object);
    explicit Value(NodePointer<Node> node) noexcept : node_(std::move(node)) {}

    NodePointer<Node> node_;
};

static_assert(sizeof(Value) == sizeof(void*));

}  // namespace contract
