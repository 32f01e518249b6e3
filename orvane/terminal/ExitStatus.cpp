// SPDX-License-Identifier: Apache-2.0
#include "orvane/terminal/ExitStatus.h"

#include "contract/pellar/MessageKeys.h"

namespace orvane {

int exitStatusFor(std::string_view verdict)
{
    using namespace contract;
    if (verdict == kPLVerdictSound.text())
        return exitSound;
    if (verdict == kPLVerdictRepaired.text())
        return exitRepaired;
    if (verdict == kPLVerdictDamaged.text())
        return exitDamaged;
    if (verdict == kPLVerdictStopped.text())
        return exitStopped;
    return exitUnchecked;
}

}  // namespace orvane
