// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/disks/DiskFacts.h"

#include <string>

namespace orvane {

/// What a volume's history is filed under.
///
/// A file system on a device is known by its UUID, because device names change from one start to
/// the next. Copies of a device have the same UUID, so while two are known at one time,
/// `sharesUUID` tells them apart by their identifiers. An image file is known by its path as well
/// as by its UUID: copies of images are everyday things, and they are not checked at one time.
/// What has no UUID is known by its identifier.
[[nodiscard]] std::string historyKeyOf(const DiskFacts& disk, bool sharesUUID);

}  // namespace orvane
