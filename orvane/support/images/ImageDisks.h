// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/disks/DiskFacts.h"
#include "orvane/support/images/ImageContents.h"

namespace orvane {

/// An image file as the disk list shows it before it is attached: its canonical path identifies
/// it.
[[nodiscard]] DiskFacts factsOfImage(const OpenImage& image);

/// The disks that an image brings when it is attached. With a partition map: a whole disk, its
/// partitions as children, numbered as in the map. Otherwise one volume, the whole file. The
/// identifiers are "PATH#NUMBER", 0 for the top.
[[nodiscard]] DiskTree disksOfImage(const OpenImage& image, const ImageContents& contents);

}  // namespace orvane
