// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "tests/pellar/JobFixture.h"

#include <sys/types.h>

#include <filesystem>
#include <string>
#include <string_view>
#include <vector>

namespace pellar::test {

/// Mode and owner of a file itself, not of what a link leads to.
struct Rights {
    mode_t mode = 0;
    uid_t user = 0;
    gid_t group = 0;

    friend bool operator==(const Rights&, const Rights&) = default;
};
Rights rightsOf(const std::filesystem::path& path);

/// A mounted volume, as the host would name it.
contract::DiskReferencePointer mountedAt(const std::filesystem::path& root);

struct PackageFile {
    std::string path;  ///< "usr/bin/x"; with "/" behind it a directory, with " -> " in it a link
    mode_t mode = 0755;
    uid_t user = 0;
    gid_t group = 0;
};

/// A small system with merged directories, whose packages are real .deb archives made and unpacked
/// by dpkg-deb(1). Needs root, because the owners do.
class DebianSystem {
public:
    /// Why there can be none here; null when there can.
    static const char* obstacle();

    DebianSystem();

    void install(const std::string& name, const std::vector<PackageFile>& files,
                 std::string_view afterInstallation = {});
    /// Writes what its apt knows: the digests of the archives that are there now.
    void writeIndex() const;
    void write(std::string_view path, std::string_view bytes) const;
    std::filesystem::path path(std::string_view name = {}) const;
    std::filesystem::path archiveOf(const std::string& name) const;
    std::filesystem::path store() const { return workshop_.path("store"); }
    contract::DiskReferencePointer disk() const { return mountedAt(path()); }

private:
    TestDirectory workshop_;
    std::string status_;
};

/// Runs permission jobs.
struct PermissionBench : JobFixture {
    using JobFixture::JobFixture;
    explicit PermissionBench(const DebianSystem& installed) : PermissionBench(installed.store()) {}
    explicit PermissionBench(const std::filesystem::path& store)
        : JobFixture(with(&JobOptions::permissionReferences, store))
    {
    }

    contract::ErrorCode verifyPermissions(const contract::DiskReferencePointer& disk)
    {
        return finish(tool->beginPermissionsVerifyForDisk(disk));
    }
    contract::ErrorCode repairPermissions(const contract::DiskReferencePointer& disk)
    {
        return finish(tool->beginPermissionsRepairForDisk(disk));
    }
    /// The problems of all runs so far, with line ends.
    std::string problems() const;
    /// The numbers and other lines that are always shown.
    std::string remarks() const;
};

}  // namespace pellar::test
