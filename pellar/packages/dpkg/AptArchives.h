// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/packages/RootDirectory.h"
#include "pellar/packages/dpkg/DpkgDatabase.h"
#include "pellar/process/Command.h"
#include "pellar/process/FileDescriptor.h"
#include "pellar/process/ProcessRunner.h"
#include "pellar/process/Stopping.h"

#include <filesystem>
#include <functional>
#include <optional>
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

/// Who hears of a fetch; either may be empty.
struct FetchListener {
    std::function<void(std::string)> trace;   ///< told each command
    std::function<void(std::string)> remark;  ///< told what apt complains of, fit to be shown
};

/// Fetches archives over the network with the apt of the running system, which also checks them.
/// Only to be used when the user has asked for it.
class ArchiveFetch {
public:
    /// `toolPath` is searched for apt-get. The switch outlives it.
    ArchiveFetch(const std::string& toolPath, StopSwitch& stop, FetchListener listener);

    /// A private copy of each package's archive, which lies in no directory; none for what cannot
    /// be had, or is not what it should be. apt gets a directory that its own user can write to,
    /// so that it can fetch without root's rights. Takes as long as the network does; stopping
    /// ends it.
    std::vector<FileDescriptor> fetch(std::span<const DpkgPackage> packages) const;

private:
    struct Download {
        ArchiveAddress archive;
        std::filesystem::path target;
    };

    void fetch(std::span<const DpkgPackage> packages, const std::filesystem::path& directory) const;
    std::vector<Download> downloadsOf(std::span<const DpkgPackage> packages,
                                      const std::filesystem::path& directory) const;
    bool download(std::span<const Download> downloads) const;
    FileDescriptor privateCopy(const std::filesystem::path& archive) const;
    /// What it complains of while it downloads is told; NO when it failed.
    bool run(Command command, RunListener& listener) const;

    std::filesystem::path aptGet_;
    StopSwitch& stop_;
    FetchListener listener_;
};

}  // namespace pellar
