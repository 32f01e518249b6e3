// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/privileges/HelperProtocol.h"
#include "pellar/texts/Texts.h"

#include <sys/types.h>

#include <optional>

namespace orvane {

/// Does the job with this program's rights, tells it on standard output, and returns when it is
/// over. `user` is for whom it is done, where that is known: without, no file of theirs is taken.
void runHelperJob(const HelperRequest& request, std::optional<uid_t> user,
                  const pellar::Texts& texts);

}  // namespace orvane
