// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/toolkit/LogModel.h"
#include "orvane/support/history/DiskHistories.h"
#include "orvane/support/texts/Catalogue.h"

namespace orvane::desktop {

/// What the log's headings say of their runs, as the histories know it. What they do not know is
/// left out. Both outlive what is answered; main thread.
[[nodiscard]] RunKnowledge runKnowledge(DiskHistories& histories, const Translator& texts);

/// In a heading: when the run began (its first record was saved), how long it took, with which
/// tool, how many problems it told of; and its verdict.
[[nodiscard]] RunNote noteOf(const RunOfRecord& known, const Translator& texts);

}  // namespace orvane::desktop
