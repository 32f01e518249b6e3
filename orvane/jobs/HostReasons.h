// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/disks/Disk.h"
#include "orvane/support/texts/Translator.h"
#include "pellar/Manager.h"

#include <string>

namespace orvane {

/// Why a disk can be neither verified nor repaired, where that is the host's to say: a module
/// leaves a failing drive out of its selection, and has no words for why a volume that the system
/// or the user works on cannot be verified. A sentence in the user's language; empty when there is
/// nothing to be said. Main thread.
[[nodiscard]] std::string reasonOfHost(const Disk& disk, const pellar::Manager& library,
                                       const Translator& texts);

}  // namespace orvane
