// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <filesystem>
#include <mutex>
#include <optional>
#include <set>
#include <string>
#include <string_view>

namespace orvane {

/// The gettext catalogues below one directory, `LANGUAGE/LC_MESSAGES/TABLE.mo`; a string table is
/// a catalogue. The tables of a process are told apart by their names, so two directories must
/// not hold one of the same name. Any thread.
class Catalogue {
public:
    explicit Catalogue(std::filesystem::path directory);

    /// None when the table has no such entry, or there is no table for the language.
    [[nodiscard]] std::optional<std::string> find(std::string_view table,
                                                  std::string_view key) const;
    /// The entry, or the key itself.
    [[nodiscard]] std::string translate(std::string_view table, std::string_view key) const;
    [[nodiscard]] std::string translatePlural(std::string_view table, std::string_view one,
                                              std::string_view many, long count) const;

private:
    /// The table's name as gettext wants it, bound to the directory; none for a name that would
    /// lead out of it.
    const char* bound(std::string_view table) const;

    std::filesystem::path directory_;
    mutable std::mutex lock_;
    mutable std::set<std::string, std::less<>> bound_;  ///< guarded by the lock; never shrinks
};

}  // namespace orvane
