// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/TerminationSignals.h"

#include <utility>

namespace orvane::desktop {

void TerminationSignals::watch(std::function<void()> received)
{
    if (signals_.descriptor() < 0)
        return;
    notifier_ = std::make_unique<QSocketNotifier>(signals_.descriptor(), QSocketNotifier::Read);
    QObject::connect(notifier_.get(), &QSocketNotifier::activated, notifier_.get(),
                     [this, received = std::move(received)] {
                         while (signals_.take())
                             received();
                     });
}

}  // namespace orvane::desktop
