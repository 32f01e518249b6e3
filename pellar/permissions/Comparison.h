// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/permissions/Accounts.h"
#include "pellar/permissions/Reference.h"
#include "pellar/texts/Texts.h"

#include <string>
#include <vector>

namespace pellar {

/// In what a file differs from its reference. Where the kind differs nothing else is compared.
struct Difference {
    bool kind = false;
    bool mode = false;
    bool user = false;
    bool group = false;
    bool capabilities = false;

    bool isNone() const { return !kind && !mode && !user && !group && !capabilities; }
    friend bool operator==(const Difference&, const Difference&) = default;
};

/// A symbolic link has no mode of its own (symlink(7)), and only regular files have capabilities.
Difference compare(const Reference& should, const Permissions& is);

/// A line for each difference, in the user's language: “Permissions differ on “usr/bin/x”: they
/// are -rw-rw-r--, should be -rw-r--r--.” Names are made fit to be shown.
std::vector<std::string> linesOf(const Difference& difference, const Reference& should,
                                 const Permissions& is, const Accounts& accounts,
                                 const Texts& texts);

}  // namespace pellar
