// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/texts/ModuleBundle.h"

#include "orvane/support/texts/Language.h"

#include <utility>

namespace orvane {

ModuleBundle::ModuleBundle(std::filesystem::path directory, std::string defaultTable)
    : directory_(std::move(directory)),
      defaultTable_(std::move(defaultTable)),
      catalogue_(directory_ / "locale")
{
}

std::string ModuleBundle::localizedString(std::string_view key, std::string_view fallback,
                                          std::string_view table) const
{
    if (key.empty())
        return std::string(fallback);
    if (auto text = catalogue_.find(table.empty() ? defaultTable_ : table, key))
        return *std::move(text);
    return std::string(fallback.empty() ? key : fallback);
}

std::uint64_t ModuleBundle::stringRevision() const
{
    return languageRevision();
}

std::filesystem::path ModuleBundle::pathForResource(std::string_view name) const
{
    const std::filesystem::path relative(name);
    const bool leadsOut =
        name.empty() || relative.is_absolute() || *relative.lexically_normal().begin() == "..";
    if (leadsOut)
        return {};
    std::error_code ignored;
    for (const auto& candidate : {directory_ / relative, directory_ / "resources" / relative})
        if (std::filesystem::exists(candidate, ignored))
            return candidate;
    return {};
}

}  // namespace orvane
