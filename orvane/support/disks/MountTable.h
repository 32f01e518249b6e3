// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <filesystem>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace orvane {

/// One mount of the process's mount namespace, as a line of /proc/self/mountinfo (proc(5)) tells.
struct Mount {
    std::string device;  ///< "major:minor"
    std::string root;    ///< what of the file system is mounted; "/" unless it is a bind mount
    std::string mountPoint;
    std::string filesystem;
    std::string source;  ///< the device's path, where there is one
    /// It was asked for. A file system that the kernel no longer writes since it met an error is not:
    /// that one is still to be repaired.
    bool isReadOnly = false;

    friend bool operator==(const Mount&, const Mount&) = default;
};

/// Lines that are no mounts are left out.
[[nodiscard]] std::vector<Mount> parseMountInfo(std::string_view text);

/// The mounts of this process now, with their devices' own nodes for sources, where the table names
/// a link; none when they cannot be read.
[[nodiscard]] std::vector<Mount> currentMounts();

/// The mount that a device is known by: "/" when it is mounted there, else its first mount of the
/// whole file system, else its first at all. File systems on several devices (btrfs) have device
/// numbers of their own and are found by the path of their source.
[[nodiscard]] std::optional<Mount> mountOfDevice(const std::vector<Mount>& mounts,
                                                 std::string_view device,
                                                 const std::filesystem::path& node);

/// The mount that holds `path`, an absolute path; none when there is no mount at all.
[[nodiscard]] std::optional<Mount> mountHolding(const std::vector<Mount>& mounts,
                                                const std::filesystem::path& path);

}  // namespace orvane
