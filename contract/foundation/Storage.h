// SPDX-License-Identifier: Apache-2.0
#pragma once

// What lies behind the handles. Shared by the foundation's sources only.

#include "contract/foundation/Array.h"
#include "contract/foundation/Dictionary.h"
#include "contract/foundation/StyledText.h"

#include <array>
#include <memory>
#include <string>
#include <vector>

namespace contract {

struct NumberNode : Node {
    NumberNode(Kind k, std::int64_t i, std::uint32_t count = 1) : Node(k, count), integer(i) {}
    explicit NumberNode(double r) : Node(Kind::Real), real(r) {}
    union {
        std::int64_t integer;
        double real;
    };
};

/// A string, or the interned name that reads as one.
struct StringNode : Node {
    explicit StringNode(std::string_view t, std::uint32_t count = 1)
        : Node(Kind::String, count), text(t)
    {
    }
    const std::string text;
};

struct Name::Interned : StringNode {
    Interned(std::string_view t, std::uint64_t h) : StringNode(t, Node::immortal), hash(h) {}
    const std::uint64_t hash;
};

struct ObjectNode : Node {
    explicit ObjectNode(std::shared_ptr<Object> o) : Node(Kind::Object), object(std::move(o)) {}
    const std::shared_ptr<Object> object;
};

struct Array::Storage : Node {
    Storage() : Node(Kind::Array) {}
    std::vector<Value> values;
};

struct Dictionary::Storage : Node {
    static constexpr std::uint32_t inlineEntries = 4;

    Storage() : Node(Kind::Dictionary) {}
    ~Storage();

    Entry* begin() noexcept { return entries; }
    void append(Name key, Value value);
    void removeAt(std::uint32_t index) noexcept;

    Entry* entries = reinterpret_cast<Entry*>(room);
    std::uint32_t count = 0;
    std::uint32_t capacity = inlineEntries;
    alignas(Entry) std::byte room[inlineEntries * sizeof(Entry)];
};

struct StyledText::Storage : Node {
    Storage(std::string_view t, const TextStyle* s) : Node(Kind::StyledText), style(s), text(t) {}
    Storage(const Storage& other);

    const TextStyle* style;                  ///< of the whole text, or of its first run
    std::unique_ptr<std::vector<Run>> runs;  ///< only when there are two styles or more
    std::string text;
};

}  // namespace contract
