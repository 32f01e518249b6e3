// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/files/Failure.h"
#include "orvane/support/history/RunTable.h"

#include <filesystem>
#include <map>
#include <optional>
#include <string>
#include <string_view>

namespace orvane {

/// Where root keeps, for everybody to read, what the scheduled checks found.
inline constexpr const char* systemChecks = "/var/lib/orvane/checks";

/// Facts about the last scheduled check of a volume. Its label is not among them: who may see the
/// device can read that there.
struct PublishedCheck {
    std::string device;      ///< its path at that time; any bytes
    std::string uuid;        ///< of the file system; may be empty
    std::optional<Run> run;  ///< with verdict and problems alone; none where all were skipped
    std::optional<Run::Time> skipped;  ///< when the last one was, if that was after the run

    friend bool operator==(const PublishedCheck& a, const PublishedCheck& b);
};

/// By what the history of the volume is filed under (DiskHistories::keyOf).
using PublishedChecks = std::map<std::string, PublishedCheck, std::less<>>;

/// What the directory holds; nothing where it is missing, or where others than root and this user
/// could change it. Any thread.
[[nodiscard]] PublishedChecks readPublishedChecks(const std::filesystem::path& directory);

/// Of two directories, what is newer of each volume.
[[nodiscard]] PublishedChecks newestOf(PublishedChecks one, const PublishedChecks& other);

/// The run of the volume; null where none is known, or where copies of the volume (of the same
/// UUID) were found to be something else. Valid as long as the checks.
[[nodiscard]] const Run* publishedRun(const PublishedChecks& checks, std::string_view key);

/// Keeps what a check found in place of what was known of the volume; a check without a run leaves
/// the run that is known. Several processes may do so at one time. The directory is made where it
/// is missing. What is older than a year is forgotten. Any thread.
[[nodiscard]] Result<void, Failure> publishCheck(const std::filesystem::path& directory,
                                                 const std::string& key, PublishedCheck check);

}  // namespace orvane
