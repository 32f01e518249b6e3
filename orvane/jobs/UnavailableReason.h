// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/SupportHost.h"
#include "pellar/Manager.h"

#include <string>

namespace orvane {

// Sentences in the user's language, for what the modules leave unsaid. Main thread.

/// Why a disk can be neither verified nor repaired, where that is the host's to say: a module
/// leaves a failing drive out of its selection, and has no words for why a volume that the system
/// or the user works on cannot be verified. Empty when there is nothing to be said.
[[nodiscard]] std::string whyUnavailable(const Disk& disk, const pellar::Manager& library,
                                         const Translator& texts);

/// Why a job did nothing to an image that it was asked to work on: it could not be attached, or
/// holds nothing that can be checked.
[[nodiscard]] std::string whyUnreached(SupportHost& host, const Disk& image,
                                       const std::string& name);

}  // namespace orvane
