// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/permissions/RootFiles.h"
#include "pellar/permissions/dpkg/DpkgStatus.h"

#include <span>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

namespace pellar {

/// What a system's apt knows of the archives of its packages: their SHA-256 digests, from
/// var/lib/apt/lists, which apt has checked against the signatures of the sources.
class ArchiveIndex {
public:
    ArchiveIndex() = default;
    /// Those of the packages that are asked about; two seconds at most for a full distribution.
    ArchiveIndex(const RootFiles& root, std::span<const DpkgPackage> packages);

    /// Of the archive of this very version; empty when no source has it. Sources may differ.
    const std::vector<std::string>& digestsOf(const DpkgPackage& package) const;

private:
    void add(int list);

    std::unordered_map<std::string, std::vector<std::string>> digests_;  ///< by file name
};

}  // namespace pellar
