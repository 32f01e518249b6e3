// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <filesystem>

namespace pellar {

class RootDirectory;

/// Where a system keeps what its packages installed.
enum class PackageDatabase { None, Dpkg, RPM, Pacman };

/// The database of the system whose root this directory is; None when it is no system's root.
/// One with two (rpm as a tool on Debian) has that of its own packages. Any thread; opens a few
/// directories.
PackageDatabase installedSystemAt(const std::filesystem::path& root);
PackageDatabase installedSystemAt(const RootDirectory& root);

/// Where rpm's database is, below the root; empty when there is none. Newer systems have it under
/// usr (Fedora's "RPMToUsr").
std::filesystem::path rpmDatabaseOf(const RootDirectory& root);

}  // namespace pellar
