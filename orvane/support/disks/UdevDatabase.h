// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <filesystem>
#include <map>
#include <string>
#include <string_view>

namespace orvane {

/// What udev has found out about the block device with this number ("8:1"): the properties
/// ("E:NAME=value") of its file. A private format of systemd, so anything unexpected reads as
/// nothing; it is asked only where the device itself may not be read. Any thread.
[[nodiscard]] std::map<std::string, std::string> udevProperties(
    const std::string& number, const std::filesystem::path& database = "/run/udev/data");

/// Undoes udev's escaping of hostile bytes in names ("\x20"), as in ID_FS_LABEL_ENC.
[[nodiscard]] std::string decodeUdevName(std::string_view encoded);

}  // namespace orvane
