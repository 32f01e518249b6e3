// SPDX-License-Identifier: Apache-2.0
#include "pellar/packages/Accounts.h"

#include "pellar/packages/RootDirectory.h"
#include "pellar/packages/TextLines.h"

#include <charconv>

namespace pellar {
namespace {

constexpr std::size_t largestFile = 8U << 20U;

std::optional<std::uint32_t> numberIn(std::string_view text)
{
    std::uint32_t number = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
    if (text.empty() || error != std::errc() || end != text.data() + text.size())
        return std::nullopt;
    return number;
}

}  // namespace

// daemon:x:1:1:daemon:/usr/sbin:/usr/sbin/nologin
AccountNames::AccountNames(std::string_view file)
{
    forEachLine(file, [this](std::string_view line) {
        const std::string name(takeField(line, ':'));
        takeField(line, ':');
        const auto number = numberIn(takeField(line, ':'));
        if (name.empty() || !number)
            return;
        numbers_.emplace(name, *number);
        names_.emplace(*number, name);
    });
}

std::optional<std::uint32_t> AccountNames::numberOf(const std::string& name) const
{
    const auto found = numbers_.find(name);
    return found != numbers_.end() ? std::optional(found->second) : std::nullopt;
}

std::string AccountNames::nameOf(std::uint32_t number) const
{
    const auto found = names_.find(number);
    return found != names_.end() ? found->second : std::string();
}

Accounts accountsOf(const RootDirectory& root)
{
    return {AccountNames(root.read("etc/passwd", largestFile).value_or("")),
            AccountNames(root.read("etc/group", largestFile).value_or(""))};
}

}  // namespace pellar
