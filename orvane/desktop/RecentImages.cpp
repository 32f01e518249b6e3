// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/RecentImages.h"

#include "contract/foundation/Array.h"
#include "orvane/support/settings/Switch.h"

#include <algorithm>

namespace orvane::desktop {
namespace {

constexpr std::string_view recentKey = "recentImages";
constexpr std::string_view openKey = "openImages";

}  // namespace

std::vector<std::string> RecentImages::files() const
{
    return stored(recentKey);
}

void RecentImages::add(const std::string& image)
{
    auto images = files();
    std::erase(images, image);
    images.insert(images.begin(), image);
    images.resize(std::min(images.size(), mostKept));
    store(recentKey, images);
}

void RecentImages::remove(const std::string& image)
{
    auto images = files();
    std::erase(images, image);
    store(recentKey, images);
}

void RecentImages::clear()
{
    store(recentKey, {});
}

std::vector<std::string> RecentImages::toReopen() const
{
    return reopensImages.isOn(settings_) ? stored(openKey) : std::vector<std::string>();
}

void RecentImages::keepOpen(const std::vector<std::string>& images)
{
    store(openKey, images);
}

// Settings that are set are written: only what is another is set.
void RecentImages::store(std::string_view key, const std::vector<std::string>& images)
{
    if (images == stored(key))
        return;
    const contract::Array list = contract::Array::make();
    for (const std::string& image : images)
        list.append(image);
    settings_.setObjectForKey(images.empty() ? contract::Value() : contract::Value(list), key);
}

std::vector<std::string> RecentImages::stored(std::string_view key) const
{
    std::vector<std::string> images;
    const contract::Array list = settings_.objectForKey(key).array();
    for (std::size_t i = 0; list && i < list.size(); ++i)
        if (const auto image = list.at(i).string(); image.starts_with('/'))
            images.emplace_back(image);
    return images;
}

}  // namespace orvane::desktop
