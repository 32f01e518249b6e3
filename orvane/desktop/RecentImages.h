// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/support/OVPreferences.h"

#include <string>
#include <string_view>
#include <vector>

namespace orvane::desktop {

/// The images that were opened before, in the settings: any bytes that are a path. Main thread.
class RecentImages {
public:
    static constexpr std::size_t mostKept = 10;

    /// The settings outlive this object.
    explicit RecentImages(contract::UserDefaults& settings) : settings_(settings) {}

    /// The one opened last comes first.
    std::vector<std::string> files() const;
    void add(const std::string& image);
    void remove(const std::string& image);
    void clear();

    /// What was open when `keepOpen` was last called, in its order; nothing where the user does not
    /// want to have it opened again (`reopensImages`).
    std::vector<std::string> toReopen() const;
    void keepOpen(const std::vector<std::string>& images);

private:
    void store(std::string_view key, const std::vector<std::string>& images);
    std::vector<std::string> stored(std::string_view key) const;

    contract::UserDefaults& settings_;
};

}  // namespace orvane::desktop
