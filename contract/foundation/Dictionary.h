// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Name.h"
#include "contract/foundation/Value.h"

#include <initializer_list>
#include <span>
#include <string>

namespace contract {

/// A handle to a mutable dictionary with interned keys that keeps the order of insertion.
/// Copies of the handle share the dictionary; a handle made by default holds none, reads as
/// empty and must not be changed.
///
/// Entries lie in one flat run, the first four inside the dictionary itself: most message
/// records have no more, and a search among so few is a handful of pointer comparisons.
class Dictionary {
public:
    struct Entry {
        Name key;
        Value value;
    };

    Dictionary() noexcept = default;
    static Dictionary make();
    /// The keys must be different ones; entries without a value are left out.
    static Dictionary of(std::initializer_list<Entry> entries);
    /// A new dictionary with the same entries; the values are shared.
    Dictionary mutableCopy() const;

    explicit operator bool() const noexcept { return static_cast<bool>(node_); }
    bool isSameAs(const Dictionary& other) const noexcept
    {
        return node_.get() == other.node_.get();
    }

    std::size_t size() const noexcept { return entries().size(); }
    bool isEmpty() const noexcept { return size() == 0; }
    bool has(Name key) const noexcept { return find(key) != nullptr; }
    /// The value under `key`, or no value.
    Value operator[](Name key) const noexcept;

    // The common readings, without counting a reference. A missing entry reads as 0, NO and "".
    std::int64_t integer(Name key) const noexcept;
    bool boolean(Name key) const noexcept { return integer(key) != 0; }
    std::string_view string(Name key) const noexcept;

    /// Replaces what is under `key`, or appends an entry. No value removes the entry.
    void set(Name key, Value value) const;
    void remove(Name key) const;

    /// In order of insertion; valid until the dictionary is next changed.
    std::span<const Entry> entries() const noexcept;

private:
    friend class Value;
    friend struct Node;
    struct Storage;
    explicit Dictionary(NodePointer<Node> node) noexcept : node_(std::move(node)) {}
    Storage* storage() const noexcept;
    const Entry* find(Name key) const noexcept;

    NodePointer<Node> node_;
};

}  // namespace contract
