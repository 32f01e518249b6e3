// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/outcome/Result.h"
#include "pellar/packages/Accounts.h"
#include "pellar/packages/Reference.h"
#include "pellar/packages/RootDirectory.h"
#include "pellar/process/ProcessOutput.h"
#include "pellar/process/Stopping.h"
#include "pellar/texts/Sentence.h"

#include <filesystem>
#include <string>

namespace pellar {

/// What the reading of a database needs of its host.
struct ReferenceSources {
    std::filesystem::path root;   ///< as this host sees it
    std::filesystem::path store;  ///< see ReferenceStore; may be empty; for the running system
    std::string toolPath;         ///< where rpm(8) is looked for
    OutputLimits outputLimits;
    std::function<void(std::string)> trace;
    std::function<void(std::string)> remark;  ///< told what apt complains of, fit to be shown
    /// The user wants the archives that are missing to be fetched over the network; only done for
    /// the running system, whose apt knows where from.
    bool fetchesArchives = false;
};

/// What all packages of the system at `root` say about their files. Otherwise why that is not
/// known; an empty sentence when it was stopped.
[[nodiscard]] Result<References, Sentence> readInstalledReferences(const RootDirectory& root,
                                                                   const Accounts& accounts,
                                                                   const ReferenceSources& sources,
                                                                   StopSwitch& stop,
                                                                   const ReadingProgress& progress);

}  // namespace pellar
