// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <filesystem>
#include <optional>
#include <string>
#include <string_view>

namespace orvane {

/// One catalogue as msgfmt(1) writes it, in UTF-8 (GNU gettext manual, 10.3 "The Format of GNU MO
/// Files"). gettext(3) is not asked, because it translates only where the system has the user's
/// locale installed: since glibc 2.41 not even LANGUAGE is heard under C.UTF-8, all that a rescue
/// system has. Immutable; any thread.
class MessageFile {
public:
    /// None where there is no such file, or it is none of these.
    [[nodiscard]] static std::optional<MessageFile> read(const std::filesystem::path& file);

    /// The translation, borrowed from this; none where there is none.
    [[nodiscard]] std::optional<std::string_view> find(std::string_view key) const;
    /// The form for `count` of a text that was given in two forms, by the file's "Plural-Forms".
    [[nodiscard]] std::optional<std::string_view> findPlural(std::string_view one,
                                                             unsigned long count) const;

private:
    explicit MessageFile(std::string bytes) : bytes_(std::move(bytes)) {}

    std::uint32_t number(std::size_t offset) const;
    /// The string that the n-th entry of a table names; empty where it would lie outside.
    std::string_view entry(std::size_t table, std::uint32_t n) const;
    std::optional<std::string_view> translation(std::string_view key) const;

    std::string bytes_;
    bool isSwapped_ = false;  ///< written on a machine of the other byte order
    std::uint32_t count_ = 0;
    std::uint32_t keys_ = 0;
    std::uint32_t texts_ = 0;
    std::string plural_;  ///< a C expression of n
};

/// The value of a plural rule, a C expression of the variable n ("n != 1", "n%10==1 ? 0 : 1"); none
/// where it is no such expression.
[[nodiscard]] std::optional<unsigned long> pluralForm(std::string_view rule, unsigned long n);

}  // namespace orvane
