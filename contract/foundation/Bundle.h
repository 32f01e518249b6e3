// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <filesystem>
#include <string>
#include <string_view>

namespace contract {

/// A directory with code and resources: a module's `NAME.ovmodule`, or the host's own.
/// Main thread only; lives as long as the process.
class Bundle {
public:
    virtual ~Bundle() = default;

    /// The text of `key` in the user's language, from the string table `table` (empty: the
    /// bundle's default table). Where the table has no entry: `fallback`, or `key` itself when
    /// `fallback` is empty.
    virtual std::string localizedString(std::string_view key, std::string_view fallback = {},
                                        std::string_view table = {}) const = 0;

    /// A number that is another one after any text of any table may have changed, as when the
    /// language is switched. What was made from texts of an older revision must be made anew.
    virtual std::uint64_t stringRevision() const = 0;

    /// Where the resource lies; empty when the bundle has none of that name.
    virtual std::filesystem::path pathForResource(std::string_view name) const = 0;
};

/// Marks a text as a key of a module's default string table, for the tool that collects them; it
/// is looked up where it is shown.
constexpr std::string_view localizable(std::string_view text)
{
    return text;
}

}  // namespace contract
