// SPDX-License-Identifier: Apache-2.0
#include "pellar/permissions/dpkg/DpkgExceptions.h"

#include "pellar/permissions/Lines.h"

#include <charconv>

namespace pellar {
namespace {

std::optional<std::uint32_t> numberIn(std::string_view text, int base)
{
    std::uint32_t number = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number, base);
    if (text.empty() || error != std::errc() || end != text.data() + text.size())
        return std::nullopt;
    return number;
}

// A number is written "#1000".
std::optional<std::uint32_t> accountIn(std::string_view text, const AccountNames& accounts)
{
    if (text.starts_with('#'))
        return numberIn(text.substr(1), 10);
    return accounts.numberOf(std::string(text));
}

}  // namespace

// root messagebus 4754 /usr/lib/dbus-1.0/dbus-daemon-launch-helper
std::vector<Reference> parseStatOverrides(std::string_view text, const Accounts& accounts,
                                          const PathAliases& aliases)
{
    std::vector<Reference> overrides;
    forEachLine(text, [&](std::string_view line) {
        const auto user = accountIn(takeField(line, ' '), accounts.users);
        const auto group = accountIn(takeField(line, ' '), accounts.groups);
        const auto mode = numberIn(takeField(line, ' '), 8);
        if (!line.starts_with('/'))
            return;
        Reference reference;
        reference.path = aliases.canonical(line);
        reference.mode = mode.value_or(0) & 07777U;
        reference.user = user.value_or(0);
        reference.group = group.value_or(0);
        reference.doubt = user && group && mode ? Doubt::None : Doubt::UnknownAccount;
        overrides.push_back(std::move(reference));
    });
    return overrides;
}

// Three lines: the file, where it is now, and the package whose own one stays (or ":" for the
// administrator, who has none).
Diversions::Diversions(std::string_view text, const PathAliases& aliases)
{
    while (!text.empty()) {
        const std::string from = aliases.canonical(takeField(text, '\n'));
        const std::string to = aliases.canonical(takeField(text, '\n'));
        diversions_[from] = {to, std::string(takeField(text, '\n'))};
    }
}

std::string Diversions::placeOf(const std::string& path, const std::string& package) const
{
    const auto found = diversions_.find(path);
    const bool isDiverted = found != diversions_.end() && found->second.package != package;
    return isDiverted ? found->second.to : path;
}

}  // namespace pellar
