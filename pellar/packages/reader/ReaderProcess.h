// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/outcome/Result.h"
#include "pellar/packages/Reference.h"
#include "pellar/packages/dpkg/DpkgReferences.h"
#include "pellar/process/Stopping.h"
#include "pellar/texts/Sentence.h"

#include <functional>

namespace pellar {

/// What the reading gets from the process that started it.
struct ReaderServices {
    const RootFiles& root;
    DpkgSources sources;
    const ReadingProgress& progress;
};

/// The reading itself. It runs where there is nothing but what these give: no file can be opened.
using Reading = std::function<std::optional<References>(
    const RootFiles& root, const DpkgSources& sources, const ReadingProgress& progress)>;

/// Carries out a reading of a database, which whoever could write to the disk may have made, in a
/// process of its own: see ReaderRights. Pressing the switch ends it at once, whatever it is at.
/// What it answers is checked to be references. Otherwise why there are none; an empty sentence
/// when it was stopped. The calling thread serves it to its end; no process stays behind.
[[nodiscard]] Result<References, Sentence> readApart(const ReaderServices& services,
                                                     StopSwitch& stop, const Reading& reading);

}  // namespace pellar
