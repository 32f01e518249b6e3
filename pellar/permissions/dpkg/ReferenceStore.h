// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/permissions/PackagedFile.h"

#include <filesystem>
#include <optional>
#include <string>
#include <vector>

namespace pellar {

/// What archives have said about their packages' files, kept for when the archives are gone: a
/// mtree(5) for each package and version, in one directory. What lies there decides about the
/// rights to a system's files, so it is only read when nobody but this user (or root) can write
/// to it.
class ReferenceStore {
public:
    /// An empty path keeps nothing. The directory is made when it is first needed.
    explicit ReferenceStore(std::filesystem::path directory);

    /// `name` is a DpkgPackage's file name.
    [[nodiscard]] std::optional<std::vector<PackagedFile>> find(const std::string& name) const;
    /// Not being able to keep it loses time at the next run, nothing else.
    void keep(const std::string& name, const std::vector<PackagedFile>& files);

    /// Archives that were fetched for a comparison.
    std::filesystem::path archiveDirectory() const { return directory_ / "archives"; }
    bool isTrusted() const { return isTrusted_; }

private:
    std::filesystem::path pathOf(const std::string& name) const;

    std::filesystem::path directory_;
    bool isTrusted_ = false;
};

}  // namespace pellar
