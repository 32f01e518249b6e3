// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <cstdint>
#include <filesystem>
#include <functional>
#include <string>
#include <vector>

namespace diskusage {

/// Where a scan ends at the latest, whatever it finds.
struct ScanLimits {
    std::uint64_t entries = 10'000'000;  ///< files and directories
    std::size_t hardLinks = 1'000'000;   ///< files of several names, which are remembered
    int depth = 128;                     ///< levels; each holds a descriptor
    std::size_t told = 12;               ///< entries that are named, the largest
};

/// What lies directly in the directory that was scanned, with all below it.
struct TopEntry {
    std::string name;         ///< any bytes
    std::uint64_t bytes = 0;  ///< that it takes on the disk
    bool isDirectory = false;
};

struct ScanResult {
    enum class End { Complete, Stopped, AtLimit };

    End end = End::Complete;
    std::vector<TopEntry> largest;   ///< largest first
    std::uint64_t otherEntries = 0;  ///< at the top level, besides these
    std::uint64_t otherBytes = 0;
    std::uint64_t bytes = 0;    ///< of all
    std::uint64_t entries = 0;  ///< that were looked at, on all levels
    std::uint64_t unreadable = 0;
    std::string firstUnreadable;    ///< its path below the directory; any bytes
    int firstError = 0;             ///< errno
    std::uint64_t otherMounts = 0;  ///< not entered
    std::uint64_t tooDeep = 0;      ///< directories that were not entered
};

/// How far a scan is.
struct ScanProgress {
    std::uint64_t bytes = 0;
    std::uint64_t entries = 0;
};

/// What takes the room in `directory`. Nothing is followed out of it: no symbolic link, nothing
/// that is mounted below, as statx(2) tells. A file of several names counts where it is met first.
/// `goesOn` is asked with every entry, and ends the scan by NO. Any thread; takes as long as there
/// are files.
[[nodiscard]] ScanResult scanDirectory(const std::filesystem::path& directory,
                                       const ScanLimits& limits,
                                       const std::function<bool(const ScanProgress&)>& goesOn);

}  // namespace diskusage
