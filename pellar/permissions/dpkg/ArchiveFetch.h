// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/permissions/dpkg/DpkgStatus.h"
#include "pellar/process/Command.h"
#include "pellar/process/ProcessRunner.h"
#include "pellar/process/StopSwitch.h"

#include <filesystem>
#include <functional>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

namespace pellar {

/// Where apt would fetch an archive from, and what it must be.
struct ArchiveAddress {
    std::string address;
    std::string name;  ///< of the file
    std::string hash;  ///< "SHA256:…"

    friend bool operator==(const ArchiveAddress&, const ArchiveAddress&) = default;
};

/// A line of "apt-get --print-uris download" (apt-get(8)); none for any other line, and for one
/// without a hash to check the archive by.
std::optional<ArchiveAddress> parseArchiveAddress(std::string_view line);

/// Fetches archives over the network with the apt of the running system, which also checks them.
/// Only to be used when the user has asked for it.
class ArchiveFetch {
public:
    /// `toolPath` is searched for apt-get. The switch outlives it.
    ArchiveFetch(const std::string& toolPath, StopSwitch& stop,
                 std::function<void(std::string)> trace);

    /// Into this directory, as the packages' file names say. What cannot be had, or is not what it
    /// should be, is not there. Takes as long as the network does; stopping ends it.
    void fetch(std::span<const DpkgPackage> packages, const std::filesystem::path& directory) const;

private:
    struct Download {
        ArchiveAddress archive;
        std::filesystem::path target;
    };

    std::vector<Download> downloadsOf(std::span<const DpkgPackage> packages,
                                      const std::filesystem::path& directory) const;
    bool download(std::span<const Download> downloads) const;
    bool run(Command command, RunListener& listener) const;

    std::filesystem::path aptGet_;
    StopSwitch& stop_;
    std::function<void(std::string)> trace_;
};

}  // namespace pellar
