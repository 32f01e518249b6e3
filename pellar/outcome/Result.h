// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cassert>
#include <type_traits>
#include <utility>
#include <variant>

namespace pellar {

/// What was asked for, or why it is not to be had. Both are given as they are:
///
///     Result<FileDescriptor, int> open(…)
///     {
///         …
///         if (descriptor < 0)
///             return errno;
///         return FileDescriptor(descriptor);
///     }
///
/// T and E must be different types. `Result<void, E>` is a success without a value: return {}.
template <class T, class E>
class [[nodiscard]] Result {
    static_assert(!std::is_same_v<T, E>, "a value could be taken for an error");

public:
    template <class Other = T>
    requires(std::is_constructible_v<T, Other> && !std::is_same_v<std::remove_cvref_t<Other>, E> &&
             !std::is_same_v<std::remove_cvref_t<Other>, Result> && std::is_convertible_v<Other, T>)
        Result(Other&& value)
        : held_(std::in_place_index<0>, std::forward<Other>(value))
    {
    }
    Result(E error) : held_(std::in_place_index<1>, std::move(error)) {}

    explicit operator bool() const { return held_.index() == 0; }

    /// Only of a success.
    T& operator*() &
    {
        assert(*this);
        return *std::get_if<0>(&held_);
    }
    const T& operator*() const&
    {
        assert(*this);
        return *std::get_if<0>(&held_);
    }
    T&& operator*() &&
    {
        assert(*this);
        return std::move(*std::get_if<0>(&held_));
    }
    T* operator->() { return &**this; }
    const T* operator->() const { return &**this; }

    /// Only of a failure.
    const E& error() const&
    {
        assert(!*this);
        return *std::get_if<1>(&held_);
    }
    E&& error() &&
    {
        assert(!*this);
        return std::move(*std::get_if<1>(&held_));
    }

private:
    std::variant<T, E> held_;
};

template <class E>
class [[nodiscard]] Result<void, E> : public Result<std::monostate, E> {
public:
    Result() : Result<std::monostate, E>(std::monostate()) {}
    Result(E error) : Result<std::monostate, E>(std::move(error)) {}
};

}  // namespace pellar
