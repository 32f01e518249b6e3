// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/texts/Catalogue.h"

#include <libintl.h>

#include <utility>

namespace orvane {

Catalogue::Catalogue(std::filesystem::path directory) : directory_(std::move(directory)) {}

const char* Catalogue::bound(std::string_view table) const
{
    if (table.empty() || table.find('/') != std::string_view::npos)
        return nullptr;
    const std::lock_guard guard(lock_);
    if (const auto found = bound_.find(table); found != bound_.end())
        return found->c_str();
    const std::string& name = *bound_.emplace(table).first;
    ::bindtextdomain(name.c_str(), directory_.c_str());
    ::bind_textdomain_codeset(name.c_str(), "UTF-8");
    return name.c_str();
}

std::optional<std::string> Catalogue::find(std::string_view table, std::string_view key) const
{
    // The entry under the empty key is the catalogue's own header.
    const char* const domain = key.empty() ? nullptr : bound(table);
    if (domain == nullptr)
        return std::nullopt;
    const std::string identifier(key);
    const char* const text = ::dgettext(domain, identifier.c_str());
    // gettext answers its own argument when it has no entry.
    if (text == identifier.c_str())
        return std::nullopt;
    return text;
}

std::string Catalogue::translate(std::string_view table, std::string_view key) const
{
    return find(table, key).value_or(std::string(key));
}

std::string Catalogue::translatePlural(std::string_view table, std::string_view one,
                                       std::string_view many, long count) const
{
    const char* const domain = bound(table);
    if (domain == nullptr)
        return std::string(count == 1 ? one : many);
    const std::string singular(one);
    const std::string plural(many);
    const auto magnitude = static_cast<unsigned long>(count < 0 ? -count : count);
    return ::dngettext(domain, singular.c_str(), plural.c_str(), magnitude);
}

}  // namespace orvane
