// SPDX-License-Identifier: Apache-2.0
#include "pellar/packages/dpkg/DpkgDatabase.h"

#include "pellar/packages/TextLines.h"

#include <algorithm>
#include <charconv>
#include <utility>

namespace pellar {
namespace {

// Debian Policy 5.6.1, 5.6.12: letters, digits and . + - ~ :, none of which leaves a directory as
// long as the text does not begin with a point, nor is an option where it begins with none.
bool isAllowedField(std::string_view text)
{
    constexpr std::size_t longest = 255;
    return !text.empty() && text.size() <= longest && text.front() != '.' && text.front() != '-' &&
           std::all_of(text.begin(), text.end(), [](char c) {
               return (c >= '0' && c <= '9') || (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') ||
                      std::string_view(".+-~:_").find(c) != std::string_view::npos;
           });
}

// Status: install ok installed
void takeStatus(std::string_view value, DpkgPackage& package, bool& isThere)
{
    takeWord(value);
    takeWord(value);
    const std::string_view state = takeWord(value);
    package.isConfigured = state == "installed" || state.starts_with("triggers-");
    isThere = !state.empty() && state != "not-installed" && state != "config-files";
}

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

bool DpkgPackage::isAllowed() const
{
    return isAllowedField(name) && isAllowedField(version) && isAllowedField(architecture);
}

std::string DpkgPackage::fileName() const
{
    std::string escaped;
    for (const char c : version)
        escaped += c == ':' ? "%3a" : std::string(1, c);
    return name + '_' + escaped + '_' + architecture;
}

std::vector<DpkgPackage> parseDpkgStatus(std::string_view text)
{
    std::vector<DpkgPackage> packages;
    DpkgPackage package;
    bool isThere = false;
    const auto endParagraph = [&] {
        const DpkgPackage ended = std::exchange(package, {});
        if (std::exchange(isThere, false) && ended.isAllowed())
            packages.push_back(ended);
    };
    forEachLine(text, [&](std::string_view line) {
        if (line.empty())
            return endParagraph();
        const std::string_view field = takeField(line, ':');
        line.remove_prefix(std::min(line.find_first_not_of(' '), line.size()));
        if (field == "Package")
            package.name = line;
        else if (field == "Version")
            package.version = line;
        else if (field == "Architecture")
            package.architecture = line;
        else if (field == "Status")
            takeStatus(line, package, isThere);
    });
    endParagraph();
    return packages;
}

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
