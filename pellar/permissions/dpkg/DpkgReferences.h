// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/permissions/Accounts.h"
#include "pellar/permissions/Reference.h"
#include "pellar/permissions/RootDirectory.h"
#include "pellar/permissions/dpkg/ReferenceStore.h"

namespace pellar {

/// What the packages of a Debian system say about their files. dpkg's database names the files
/// and no more (dpkg(1), --verify), so the rest comes from the archives in the system's own
/// var/cache/apt/archives and from what the store has kept; packages with neither are counted.
/// Reading the archives takes about a second for 1,500 files. None when it was stopped.
[[nodiscard]] std::optional<References> readDpkgReferences(const RootDirectory& root,
                                                           const Accounts& accounts,
                                                           ReferenceStore& store,
                                                           const ReadingProgress& progress);

}  // namespace pellar
