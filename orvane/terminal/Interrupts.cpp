// SPDX-License-Identifier: Apache-2.0
#include "orvane/terminal/Interrupts.h"

#include <poll.h>

namespace orvane {

Interrupts::Interrupts(MainLoop& loop, std::function<void()> interrupted)
    : loop_(loop), interrupted_(std::move(interrupted))
{
    if (signals_.descriptor() < 0)
        return;
    loop_.watch(signals_.descriptor(), POLLIN, [this](short) {
        while (signals_.take())
            interrupted_();
    });
}

Interrupts::~Interrupts()
{
    if (signals_.descriptor() >= 0)
        loop_.unwatch(signals_.descriptor());
}

}  // namespace orvane
