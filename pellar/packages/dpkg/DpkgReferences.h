// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/packages/Accounts.h"
#include "pellar/packages/Reference.h"
#include "pellar/packages/RootDirectory.h"
#include "pellar/packages/dpkg/DpkgDatabase.h"
#include "pellar/packages/dpkg/ReferenceStore.h"

#include <functional>
#include <span>
#include <vector>

namespace pellar {

/// Gets the archives of these packages: a descriptor for each, at its beginning, or none.
using FetchArchives =
    std::function<std::vector<FileDescriptor>(std::span<const DpkgPackage> packages)>;

/// Where archives' words come from besides the system that is looked at. Both are only for the
/// running system itself.
struct DpkgSources {
    KeptReferences* kept = nullptr;  ///< borrowed; may be none
    FetchArchives fetch;             ///< empty where nobody has asked for that
};

/// What the packages of a Debian system say about their files. dpkg's database names the files
/// and no more (dpkg(1), --verify), so the rest comes from the archives in the system's own
/// var/cache/apt/archives and from what was kept of such archives before; packages with neither
/// are counted. An archive must have the digest that the system's own apt knows it by, where that
/// knows the version. Reading the archives takes about a second for 1,500 files; missing ones are
/// fetched a few at a time. None when `progress` asked for an end.
[[nodiscard]] std::optional<References> readDpkgReferences(const RootFiles& root,
                                                           const Accounts& accounts,
                                                           const DpkgSources& sources,
                                                           const ReadingProgress& progress);

}  // namespace pellar
