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

    [[nodiscard]] bool has(const std::string& name) const;

    /// Where it keeps them, and where archives go that are fetched to be read; empty where the
    /// store is of no use.
    [[nodiscard]] std::filesystem::path directory() const
    {
        return isTrusted_ ? directory_ : std::filesystem::path();
    }

private:
    std::filesystem::path pathOf(const std::string& name) const;

    std::filesystem::path directory_;
    bool isTrusted_ = false;
};

}  // namespace pellar
