// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <string_view>

namespace pellar {

/// The names and numbers of a passwd(5) or group(5) file.
class AccountNames {
public:
    AccountNames() = default;
    explicit AccountNames(std::string_view file);

    std::optional<std::uint32_t> numberOf(const std::string& name) const;
    /// Empty when nobody has the number; the first of several names.
    std::string nameOf(std::uint32_t number) const;

private:
    std::map<std::string, std::uint32_t> numbers_;
    std::map<std::uint32_t, std::string> names_;
};

class RootDirectory;

/// A system's own accounts. The host's say nothing about a system that is mounted somewhere.
struct Accounts {
    AccountNames users;
    AccountNames groups;
};

Accounts accountsOf(const RootDirectory& root);

}  // namespace pellar
