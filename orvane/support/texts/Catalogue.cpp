// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/texts/Catalogue.h"

#include "orvane/support/texts/Language.h"

#include <algorithm>
#include <utility>

namespace orvane {
Catalogue::Catalogue(std::filesystem::path directory) : directory_(std::move(directory)) {}

const Catalogue::Files& Catalogue::filesOf(std::string_view table) const
{
    const std::uint64_t revision = languageRevision();
    if (std::exchange(revision_, revision) != revision)
        files_.clear();
    if (const auto found = files_.find(table); found != files_.end())
        return found->second;
    Files files;
    std::vector<std::string> languages = languageFolders(currentLanguages());
    languages.emplace_back("en");
    if (!table.empty() && table.find('/') == std::string_view::npos)
        for (const std::string& language : languages)
            if (auto file = MessageFile::read(directory_ / language / "LC_MESSAGES" /
                                              (std::string(table) + ".mo")))
                files.push_back(std::move(*file));
    return files_.emplace(table, std::move(files)).first->second;
}

std::optional<std::string> Catalogue::find(std::string_view table, std::string_view key) const
{
    const std::lock_guard guard(lock_);
    for (const MessageFile& file : filesOf(table))
        if (const auto text = file.find(key))
            return std::string(*text);
    return std::nullopt;
}

std::string Catalogue::translate(std::string_view table, std::string_view key) const
{
    return find(table, key).value_or(std::string(key));
}

std::string Catalogue::translatePlural(std::string_view table, std::string_view one,
                                       std::string_view many, long count) const
{
    const auto magnitude = static_cast<unsigned long>(count < 0 ? -count : count);
    const std::lock_guard guard(lock_);
    for (const MessageFile& file : filesOf(table))
        if (const auto text = file.findPlural(one, magnitude))
            return std::string(*text);
    return std::string(magnitude == 1 ? one : many);
}

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
