// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <atomic>
#include <cstdint>

namespace contract {

/// What a value is. The order is of no meaning and is never stored.
enum class Kind : std::uint8_t {
    None,
    Boolean,
    Integer,
    Real,
    String,
    Array,
    Dictionary,
    StyledText,
    Object,
};

/// The counted head of everything a Value can hold. A message log keeps millions of these, so
/// there is no virtual table: eight bytes, and the kind says how to destroy the rest.
///
/// Counting is atomic, because a job's thread builds what the main thread later reads; the
/// contents are not locked, so one node is used by one thread at a time.
struct Node {
    static constexpr std::uint32_t immortal = 0x8000'0000;

    explicit Node(Kind k, std::uint32_t count = 1) noexcept : references(count), kind(k) {}
    Node(const Node&) = delete;
    Node& operator=(const Node&) = delete;

    /// Immortal nodes (interned names, small numbers) are shared by all and never counted.
    bool isImmortal() const noexcept
    {
        return references.load(std::memory_order_relaxed) >= immortal;
    }

    void retain() noexcept
    {
        if (!isImmortal())
            references.fetch_add(1, std::memory_order_relaxed);
    }

    /// Gives one reference up and destroys the node when it was the last one.
    void release() noexcept
    {
        if (!isImmortal() && references.fetch_sub(1, std::memory_order_acq_rel) == 1)
            destroy(this);
    }

    std::atomic<std::uint32_t> references;
    const Kind kind;

private:
    static void destroy(Node* node) noexcept;
};

static_assert(sizeof(Node) == 8);

/// Owns one reference to a node of type T, or nothing. Copies share the node.
template <class T>
class NodePointer {
public:
    NodePointer() noexcept = default;
    NodePointer(const NodePointer& other) noexcept : node_(other.node_)
    {
        if (node_ != nullptr)
            node_->retain();
    }
    NodePointer(NodePointer&& other) noexcept : node_(other.node_) { other.node_ = nullptr; }
    NodePointer& operator=(NodePointer other) noexcept
    {
        T* const mine = node_;
        node_ = other.node_;
        other.node_ = mine;
        return *this;
    }
    ~NodePointer()
    {
        if (node_ != nullptr)
            node_->release();
    }

    /// Takes over a reference that the caller already has.
    static NodePointer adopting(T* node) noexcept
    {
        NodePointer pointer;
        pointer.node_ = node;
        return pointer;
    }
    /// Adds a reference of its own.
    static NodePointer sharing(T* node) noexcept
    {
        if (node != nullptr)
            node->retain();
        return adopting(node);
    }

    T* get() const noexcept { return node_; }
    T* operator->() const noexcept { return node_; }
    T& operator*() const noexcept { return *node_; }
    explicit operator bool() const noexcept { return node_ != nullptr; }

private:
    T* node_ = nullptr;
};

}  // namespace contract
