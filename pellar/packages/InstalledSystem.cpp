// SPDX-License-Identifier: Apache-2.0
#include "pellar/packages/InstalledSystem.h"

#include "pellar/packages/RootDirectory.h"

namespace pellar {

std::filesystem::path rpmDatabaseOf(const RootDirectory& root)
{
    for (const char* const directory : {"usr/lib/sysimage/rpm", "var/lib/rpm"})
        for (const char* const file : {"rpmdb.sqlite", "Packages.db", "Packages"})
            if (root.openFile(std::string(directory) + '/' + file))
                return directory;
    return {};
}

PackageDatabase installedSystemAt(const RootDirectory& root)
{
    if (!root.openFile("etc/passwd"))
        return PackageDatabase::None;
    if (root.openFile("var/lib/dpkg/status"))
        return PackageDatabase::Dpkg;
    if (root.openFile("var/lib/pacman/local/ALPM_DB_VERSION"))
        return PackageDatabase::Pacman;
    return rpmDatabaseOf(root).empty() ? PackageDatabase::None : PackageDatabase::RPM;
}

PackageDatabase installedSystemAt(const std::filesystem::path& root)
{
    const auto directory = RootDirectory::open(root);
    return directory ? installedSystemAt(*directory) : PackageDatabase::None;
}

}  // namespace pellar
