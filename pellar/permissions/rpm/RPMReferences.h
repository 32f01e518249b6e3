// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/permissions/Accounts.h"
#include "pellar/permissions/Reference.h"
#include "pellar/permissions/RootDirectory.h"
#include "pellar/process/ProcessRunner.h"
#include "pellar/texts/Sentence.h"

#include <filesystem>
#include <functional>
#include <string>
#include <variant>

namespace pellar {

/// Where a query of rpm(8) goes, and who hears of it.
struct RPMQuery {
    std::filesystem::path program;   ///< rpm, on this host
    std::filesystem::path database;  ///< absolute, as this host sees it
    OutputLimits limits;
    std::function<void(std::string)> trace;  ///< told the command; may be empty
};

/// What the packages of an RPM system say about their files, asked of this host's rpm. The
/// database is named in the command: on a system of another kind rpm's own is in a home
/// directory. Otherwise why it could not be asked; an empty sentence when it was stopped.
[[nodiscard]] std::variant<References, Sentence> readRPMReferences(const RootDirectory& root,
                                                                   const Accounts& accounts,
                                                                   const RPMQuery& query,
                                                                   StopSwitch& stop);

}  // namespace pellar
