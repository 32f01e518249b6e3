// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Value.h"

#include <cstddef>
#include <initializer_list>
#include <vector>

namespace contract {

/// A handle to a mutable list of values. Copies of the handle share the list; a handle made by
/// default holds none, and is then empty to read and must not be changed.
class Array {
public:
    Array() noexcept = default;
    static Array make();
    static Array of(std::initializer_list<Value> values);

    explicit operator bool() const noexcept { return static_cast<bool>(node_); }
    /// The same list, not merely equal contents.
    bool isSameAs(const Array& other) const noexcept { return node_.get() == other.node_.get(); }

    std::size_t size() const noexcept;
    bool isEmpty() const noexcept { return size() == 0; }
    /// No value when `index` is past the end.
    Value at(std::size_t index) const noexcept;
    Value front() const noexcept { return at(0); }
    Value back() const noexcept { return isEmpty() ? Value() : at(size() - 1); }
    const std::vector<Value>& values() const noexcept;

    void append(Value value) const;
    void append(const Array& others) const;
    void removeFront() const;
    void removeAll() const;

private:
    friend class Value;
    friend struct Node;
    struct Storage;
    explicit Array(NodePointer<Node> node) noexcept : node_(std::move(node)) {}
    Storage* storage() const noexcept;

    NodePointer<Node> node_;
};

}  // namespace contract
