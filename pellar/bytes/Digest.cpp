// SPDX-License-Identifier: Apache-2.0
#include "pellar/bytes/Digest.h"

#include <nettle/md5.h>
#include <nettle/nettle-meta.h>
#include <nettle/sha1.h>
#include <nettle/sha2.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <vector>

namespace pellar {
namespace {

const nettle_hash& hashOf(DigestKind kind)
{
    switch (kind) {
        case DigestKind::MD5: return nettle_md5;
        case DigestKind::SHA1: return nettle_sha1;
        case DigestKind::SHA512: return nettle_sha512;
        case DigestKind::SHA256: break;
    }
    return nettle_sha256;
}

}  // namespace

std::optional<DigestKind> kindOfDigest(std::string_view hexadecimal)
{
    const bool isHexadecimal = std::all_of(hexadecimal.begin(), hexadecimal.end(), [](char c) {
        return (c >= '0' && c <= '9') || (c >= 'a' && c <= 'f');
    });
    for (const DigestKind kind :
         {DigestKind::MD5, DigestKind::SHA1, DigestKind::SHA256, DigestKind::SHA512})
        if (isHexadecimal && hexadecimal.size() == 2U * hashOf(kind).digest_size)
            return kind;
    return std::nullopt;
}

struct Digester::State {
    const nettle_hash& hash;
    std::vector<std::max_align_t> context;
};

Digester::Digester(DigestKind kind)
    : state_(std::make_unique<State>(State{
          hashOf(kind),
          std::vector<std::max_align_t>(hashOf(kind).context_size / sizeof(std::max_align_t) + 1)}))
{
    state_->hash.init(state_->context.data());
}

Digester::Digester(Digester&&) noexcept = default;
Digester::~Digester() = default;

void Digester::add(std::string_view bytes)
{
    state_->hash.update(state_->context.data(), bytes.size(),
                        reinterpret_cast<const std::uint8_t*>(bytes.data()));
}

std::string Digester::finish()
{
    std::vector<std::uint8_t> digest(state_->hash.digest_size);
    state_->hash.digest(state_->context.data(), digest.size(), digest.data());
    constexpr std::string_view digits = "0123456789abcdef";
    std::string text;
    for (const std::uint8_t byte : digest) {
        text += digits[byte >> 4U];
        text += digits[byte & 15U];
    }
    return text;
}

std::optional<std::string> digestOfFile(int file, DigestKind kind, std::uint64_t largest)
{
    Digester digester(kind);
    std::vector<char> buffer(1U << 17U);
    for (std::uint64_t place = 0; place <= largest;) {
        const ssize_t count =
            ::pread(file, buffer.data(), buffer.size(), static_cast<off_t>(place));
        if (count == 0)
            return digester.finish();
        if (count < 0 && errno != EINTR)
            return std::nullopt;
        digester.add({buffer.data(), static_cast<std::size_t>(std::max<ssize_t>(count, 0))});
        place += static_cast<std::uint64_t>(std::max<ssize_t>(count, 0));
    }
    return std::nullopt;
}

}  // namespace pellar
