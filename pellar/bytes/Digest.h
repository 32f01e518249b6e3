// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

namespace pellar {

enum class DigestKind { MD5, SHA1, SHA256, SHA512 };

/// Hexadecimal digests of these kinds have different lengths, so none needs to be named. None for
/// anything else.
std::optional<DigestKind> kindOfDigest(std::string_view hexadecimal);

/// Takes bytes and answers their digest.
class Digester {
public:
    explicit Digester(DigestKind kind);
    Digester(Digester&&) noexcept;
    Digester& operator=(Digester&&) = delete;
    ~Digester();

    void add(std::string_view bytes);
    /// In small hexadecimal letters. Begins anew.
    [[nodiscard]] std::string finish();

private:
    struct State;
    std::unique_ptr<State> state_;
};

/// Of an open file's contents, wherever it is read at; none when it cannot be read, or has more
/// bytes than `largest`.
[[nodiscard]] std::optional<std::string> digestOfFile(int file, DigestKind kind,
                                                      std::uint64_t largest);

}  // namespace pellar
