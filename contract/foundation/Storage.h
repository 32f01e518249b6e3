// SPDX-License-Identifier: Apache-2.0
#pragma once

// What lies behind the handles. Shared by the foundation's sources only.

#include "contract/foundation/Array.h"
#include "contract/foundation/Dictionary.h"
#include "contract/foundation/StyledText.h"

#include <cstddef>
#include <cstdint>
#include <memory>
#include <span>
#include <string>
#include <string_view>
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

/// A few entries lie in the node itself, more in a vector in their place.
struct Dictionary::Storage : Node {
    static constexpr std::size_t mostFew = 4;

    Storage() : Node(Kind::Dictionary) {}
    ~Storage();

    std::span<Entry> entries() noexcept;
    void append(Name key, Value value);
    void removeAt(std::size_t index) noexcept;

    bool hasMany = false;
    std::uint8_t fewCount = 0;
    union {
        Entry few[mostFew];
        std::vector<Entry> many;
    };
};

/// The characters follow the node in the same piece of memory. A text that does not fit there, or
/// not any more, or that has several styles, moves to a place of its own.
struct StyledText::Storage : Node {
    struct Moved {
        std::string text;
        std::vector<Run> runs;  ///< only when there are two styles or more
        const TextStyle* style;
    };

    static Storage* make(std::string_view text, const TextStyle* style);
    static void destroy(Storage* storage) noexcept;

    std::string_view text() const noexcept;
    bool hasRuns() const noexcept { return hasMoved && !moved->runs.empty(); }
    /// Of the whole text, or of its first run.
    const TextStyle* style() const noexcept { return hasMoved ? moved->style : ownStyle; }
    void setStyle(const TextStyle* style) noexcept;
    /// Of the two, runs are added first.
    void addRuns(const std::vector<Run>& added);
    void addText(std::string_view characters);
    Moved& moveOut();

    bool hasMoved : 1 = false;
    std::uint8_t room : 7 = 0;  ///< bytes behind the characters that an addition may take
    std::uint16_t length = 0;
    union {
        const TextStyle* ownStyle;
        Moved* moved;
    };

private:
    explicit Storage(const TextStyle* style) : Node(Kind::StyledText), ownStyle(style) {}
    const char* characters() const noexcept { return reinterpret_cast<const char*>(this + 1); }
    char* characters() noexcept { return reinterpret_cast<char*>(this + 1); }
};

}  // namespace contract
