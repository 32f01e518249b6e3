// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/jobs/JobObserver.h"
#include "orvane/support/SupportHost.h"

#include <string>

namespace orvane {

/// Why a job did nothing to an image that it was asked to work on: it could not be attached, or
/// holds nothing that can be checked. One sentence in the user's language. Main thread.
[[nodiscard]] std::string whyUnreached(SupportHost& host, const Disk& image,
                                       const std::string& name);

/// Keeps that with the image: as a failed run, and as a line of its log. A check that did not take
/// place must not look like one that had nothing to say. Main thread.
void keepUnreached(SupportHost& host, Disk& image, Operation operation,
                   const std::string& sentence);

}  // namespace orvane
