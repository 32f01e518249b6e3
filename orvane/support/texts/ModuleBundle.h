// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Bundle.h"
#include "orvane/support/texts/Catalogue.h"

namespace orvane {

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
