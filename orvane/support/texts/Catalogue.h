// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Bundle.h"
#include "contract/foundation/Format.h"
#include "orvane/support/texts/MessageFile.h"

#include <cstdint>
#include <filesystem>
#include <functional>
#include <initializer_list>
#include <map>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace orvane {

/// How the host's own sentences get into the user's language. Any thread. The key is the English
/// text; without a translation it is also the answer.
struct Translator {
    std::function<std::string(std::string_view key)> text = [](std::string_view key) {
        return std::string(key);
    };
    /// The form of the language for `count` things.
    std::function<std::string(std::string_view one, std::string_view many, long count)> plural =
        [](std::string_view one, std::string_view many, long count) {
            return std::string(count == 1 ? one : many);
        };

    /// The translated format filled with arguments (contract/foundation/Format.h).
    std::string sentence(std::string_view key,
                         std::initializer_list<contract::FormatArgument> arguments) const
    {
        return contract::format(text(key), arguments);
    }
};

/// The gettext catalogues below one directory, `LANGUAGE/LC_MESSAGES/TABLE.mo`; a string table is
/// a catalogue. Texts come in the first of the languages in force (Language.h) that has them, then
/// in English, where the key itself is not the best English. Any thread.
class Catalogue {
public:
    explicit Catalogue(std::filesystem::path directory);

    /// None when the table has no such entry, or there is no table for the languages.
    [[nodiscard]] std::optional<std::string> find(std::string_view table,
                                                  std::string_view key) const;
    /// The entry, or the key itself.
    [[nodiscard]] std::string translate(std::string_view table, std::string_view key) const;
    [[nodiscard]] std::string translatePlural(std::string_view table, std::string_view one,
                                              std::string_view many, long count) const;

private:
    using Files = std::vector<MessageFile>;

    /// The table's files in the order of the languages. The lock is held.
    const Files& filesOf(std::string_view table) const;

    std::filesystem::path directory_;
    mutable std::mutex lock_;
    mutable std::uint64_t revision_ = 0;                       ///< guarded by the lock
    mutable std::map<std::string, Files, std::less<>> files_;  ///< guarded; for that revision
};

/// A directory with resources, and with its string tables in `locale`: a module's bundle or the
/// host's own. Unlike the contract asks, any thread may ask for texts.
class ModuleBundle final : public contract::Bundle {
public:
    ModuleBundle(std::filesystem::path directory, std::string defaultTable);

    std::string localizedString(std::string_view key, std::string_view fallback = {},
                                std::string_view table = {}) const override;
    std::uint64_t stringRevision() const override;
    /// Looked for in the bundle itself, then in its `resources`.
    std::filesystem::path pathForResource(std::string_view name) const override;

    const std::filesystem::path& directory() const { return directory_; }
    const Catalogue& catalogue() const { return catalogue_; }

private:
    std::filesystem::path directory_;
    std::string defaultTable_;
    Catalogue catalogue_;
};

}  // namespace orvane
