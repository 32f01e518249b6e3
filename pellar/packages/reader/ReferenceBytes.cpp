// SPDX-License-Identifier: Apache-2.0
#include "pellar/packages/reader/ReferenceBytes.h"

#include "pellar/bytes/Digest.h"
#include "pellar/packages/Permissions.h"

#include <array>
#include <cstring>
#include <utility>

namespace pellar {
namespace {

constexpr std::uint64_t noKind = 255;
constexpr std::size_t longestText = 8192;  ///< twice PATH_MAX

void addNumber(std::string& bytes, std::uint64_t number)
{
    std::array<char, sizeof number> raw{};
    std::memcpy(raw.data(), &number, sizeof number);
    bytes.append(raw.data(), raw.size());
}

void addText(std::string& bytes, std::string_view text)
{
    addNumber(bytes, text.size());
    bytes += text;
}

/// Takes what was added, in the same order. After the first thing that cannot be, nothing is sound.
class ByteReader {
public:
    explicit ByteReader(std::string_view bytes) : rest_(bytes) {}

    std::uint64_t number(std::uint64_t largest = UINT64_MAX)
    {
        std::uint64_t number = 0;
        if (rest_.size() < sizeof number) {
            isSound_ = false;
            rest_ = {};
            return 0;
        }
        std::memcpy(&number, rest_.data(), sizeof number);
        rest_.remove_prefix(sizeof number);
        isSound_ = isSound_ && number <= largest;
        return isSound_ ? number : 0;
    }

    std::string text()
    {
        const std::uint64_t length = number(longestText);
        if (length > rest_.size())
            isSound_ = false;
        if (!isSound_)
            return {};
        std::string text(rest_.substr(0, length));
        rest_.remove_prefix(length);
        isSound_ = text.find('\0') == std::string::npos;
        return text;
    }

    bool isSound() const { return isSound_; }
    bool isAtEnd() const { return rest_.empty(); }
    void demand(bool condition) { isSound_ = isSound_ && condition; }

private:
    std::string_view rest_;
    bool isSound_ = true;
};

Reference referenceFrom(ByteReader& reader)
{
    Reference reference;
    reference.path = reader.text();
    const std::uint64_t kind = reader.number(noKind);
    reader.demand(kind == noKind || kind <= static_cast<std::uint64_t>(FileKind::Other));
    if (kind != noKind)
        reference.kind = static_cast<FileKind>(kind);
    reference.mode = static_cast<mode_t>(reader.number(07777));
    reference.user = static_cast<uid_t>(reader.number(UINT32_MAX - 1));
    reference.group = static_cast<gid_t>(reader.number(UINT32_MAX - 1));
    if (reader.number(1) == 1)
        reference.capabilities = canonicalCapabilities(reader.text());
    reference.doubt =
        static_cast<Doubt>(reader.number(static_cast<std::uint64_t>(Doubt::NotVerified)));
    reference.digest = reader.text();
    reader.demand(reference.digest.empty() || kindOfDigest(reference.digest).has_value());
    reader.demand(!reference.path.empty() && !reference.path.starts_with('/'));
    return reference;
}

}  // namespace

std::string bytesOf(const References& references)
{
    std::string bytes;
    for (const std::uint64_t count :
         {references.packages, references.packagesWithoutSource, references.packagesBeyondBounds,
          static_cast<std::uint64_t>(references.files.size())})
        addNumber(bytes, count);
    for (const Reference& reference : references.files) {
        addText(bytes, reference.path);
        addNumber(bytes, reference.kind ? static_cast<std::uint64_t>(*reference.kind) : noKind);
        for (const std::uint64_t number :
             {std::uint64_t{reference.mode}, std::uint64_t{reference.user},
              std::uint64_t{reference.group}, std::uint64_t{reference.capabilities.has_value()}})
            addNumber(bytes, number);
        if (reference.capabilities)
            addText(bytes, *reference.capabilities);
        addNumber(bytes, static_cast<std::uint64_t>(reference.doubt));
        addText(bytes, reference.digest);
    }
    for (const std::string& path : references.filesWithoutSource)
        addText(bytes, path);
    return bytes;
}

std::optional<References> referencesIn(std::string_view bytes)
{
    ByteReader reader(bytes);
    References references;
    references.packages = reader.number();
    references.packagesWithoutSource = reader.number(references.packages);
    references.packagesBeyondBounds = reader.number(references.packagesWithoutSource);
    for (std::uint64_t left = reader.number(bytes.size()); left > 0 && reader.isSound(); --left)
        references.files.push_back(referenceFrom(reader));
    while (reader.isSound() && !reader.isAtEnd())
        references.filesWithoutSource.push_back(reader.text());
    return reader.isSound() ? std::optional(std::move(references)) : std::nullopt;
}

}  // namespace pellar
