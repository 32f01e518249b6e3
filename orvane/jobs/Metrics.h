// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/jobs/JobLedger.h"

#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace orvane {

/// What is told of one volume, or of the partition map of a disk.
struct MeasuredDisk {
    std::string device;                     ///< its path, of an image the file's; any bytes
    std::string uuid;                       ///< of the file system; any bytes, may be empty
    std::string label;                      ///< any bytes, may be empty
    std::vector<Run> runs = {};             ///< on it, oldest first
    std::optional<Run::Time> skipped = {};  ///< a scheduled check, after the last run
};

/// The last verdicts and times in the text format of Prometheus (version 0.0.4; Prometheus,
/// "Exposition formats"), for the text file collector of its node exporter. What a disk was checked
/// for is told apart: its file system, its partition map, the permissions of installed files. What
/// never was checked is not told of. `version` is the program's.
[[nodiscard]] std::string expositionOf(const std::vector<MeasuredDisk>& disks,
                                       std::string_view version);

}  // namespace orvane
