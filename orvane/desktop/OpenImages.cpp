// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/OpenImages.h"

#include "contract/foundation/Array.h"
#include "orvane/support/settings/Switch.h"

#include <algorithm>
#include <filesystem>
#include <system_error>

namespace orvane::desktop {
namespace {

constexpr std::string_view key = "openImages";

}  // namespace

std::vector<std::string> disksToOpen(SupportHost& host, std::vector<std::string> named)
{
    const contract::UserDefaults& settings = host.standardUserDefaults();
    const contract::Value kept = settings.objectForKey(key);
    if (!reopensImages.isOn(settings) || kept.kind() != contract::Kind::Array)
        return named;
    for (const contract::Value& image : kept.array().values()) {
        std::error_code ignored;
        if (image.kind() == contract::Kind::String && image.string().starts_with("/") &&
            std::filesystem::is_regular_file(image.string(), ignored) &&
            std::ranges::find(named, image.string()) == named.end())
            named.emplace_back(image.string());
    }
    return named;
}

void rememberImages(SupportHost& host)
{
    contract::UserDefaults& settings = host.standardUserDefaults();
    const contract::Array images = contract::Array::make();
    if (reopensImages.isOn(settings))
        for (const auto& disk : host.sharedDiskController().roots())
            if (disk->isOfflineDiskImage())
                images.append(disk->diskImagePath());
    if (images.size() > 0)
        settings.setObjectForKey(images, key);
    else if (!settings.objectForKey(key).isNone())
        settings.setObjectForKey({}, key);
}

}  // namespace orvane::desktop
