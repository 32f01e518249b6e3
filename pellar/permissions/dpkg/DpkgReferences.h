// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/permissions/Accounts.h"
#include "pellar/permissions/Reference.h"
#include "pellar/permissions/RootDirectory.h"
#include "pellar/permissions/dpkg/DpkgStatus.h"
#include "pellar/permissions/dpkg/ReferenceStore.h"

#include <filesystem>
#include <functional>
#include <span>

namespace pellar {

/// Gets the archives of these packages into the directory, as their file names say.
using FetchArchives = std::function<void(std::span<const DpkgPackage> packages,
                                         const std::filesystem::path& directory)>;

/// What the packages of a Debian system say about their files. dpkg's database names the files
/// and no more (dpkg(1), --verify), so the rest comes from the archives in the system's own
/// var/cache/apt/archives and from what the store has kept; packages with neither are counted.
/// Reading the archives takes about a second for 1,500 files. `fetch` gets the missing ones, a few
/// at a time, which go again once they have been read; empty where nobody has asked for that. None
/// when it was stopped.
[[nodiscard]] std::optional<References> readDpkgReferences(const RootDirectory& root,
                                                           const Accounts& accounts,
                                                           ReferenceStore& store,
                                                           const FetchArchives& fetch,
                                                           const ReadingProgress& progress);

}  // namespace pellar
