// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/Sentence.h"
#include "pellar/permissions/Accounts.h"
#include "pellar/permissions/Reference.h"
#include "pellar/permissions/RootDirectory.h"
#include "pellar/process/OutputBudget.h"
#include "pellar/process/StopSwitch.h"

#include <filesystem>
#include <string>
#include <variant>

namespace pellar {

/// What the reading of a database needs of its host.
struct ReferenceSources {
    std::filesystem::path root;   ///< as this host sees it
    std::filesystem::path store;  ///< see ReferenceStore; may be empty
    std::string toolPath;         ///< where rpm(8) is looked for
    OutputLimits outputLimits;
    std::function<void(std::string)> trace;
};

/// What all packages of the system at `root` say about their files. Otherwise why that is not
/// known; an empty sentence when it was stopped.
[[nodiscard]] std::variant<References, Sentence> readInstalledReferences(
    const RootDirectory& root, const Accounts& accounts, const ReferenceSources& sources,
    StopSwitch& stop, const ReadingProgress& progress);

}  // namespace pellar
