// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <map>
#include <string>
#include <string_view>

namespace orvane {

/// What udev has found out about a device: the properties ("E:NAME=value") of its file in
/// /run/udev/data. A private format of systemd, so anything unexpected reads as nothing; it is
/// asked only where the device itself may not be read.
[[nodiscard]] std::map<std::string, std::string> parseUdevProperties(std::string_view text);

/// Undoes udev's escaping of hostile bytes in names ("\x20"), as in ID_FS_LABEL_ENC.
[[nodiscard]] std::string decodeUdevName(std::string_view encoded);

}  // namespace orvane
