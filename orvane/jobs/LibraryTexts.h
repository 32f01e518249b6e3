// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/texts/Catalogue.h"
#include "pellar/texts/Texts.h"

#include <algorithm>
#include <limits>

namespace orvane {

/// The disk-management library's texts, from the host's catalogues; its results from those of the
/// module that reads them.
class LibraryTexts final : public pellar::Texts {
public:
    /// `hostTexts` outlives this object.
    explicit LibraryTexts(const Catalogue& hostTexts) : hostTexts_(hostTexts) {}

    /// Before the first job: the catalogue in which the module looks the same phrases up.
    void setResultTexts(const Catalogue& moduleTexts) { resultTexts_ = &moduleTexts; }

    std::string text(std::string_view englishKey) const override
    {
        return hostTexts_.translate("Pellar", englishKey);
    }
    std::string pluralText(std::string_view englishOne, std::string_view englishMany,
                           std::uint64_t count) const override
    {
        constexpr std::uint64_t greatest = std::numeric_limits<long>::max();
        return hostTexts_.translatePlural("Pellar", englishOne, englishMany,
                                          static_cast<long>(std::min(count, greatest)));
    }
    std::string resultText(std::string_view englishKey) const override
    {
        return resultTexts_ != nullptr ? resultTexts_->translate("LocalizableFsck", englishKey)
                                       : std::string(englishKey);
    }

private:
    const Catalogue& hostTexts_;
    const Catalogue* resultTexts_ = nullptr;
};

}  // namespace orvane
