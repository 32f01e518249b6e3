// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/loop/HostLoop.h"

#include "orvane/support/loop/Outbox.h"
#include "orvane/support/loop/Rendezvous.h"

namespace orvane {

void HostLoop::performOnMainThread(Task task, Wait wait)
{
    if (Outbox* const outbox = Outbox::ofThisThread()) {
        outbox->perform(std::move(task), wait);
    } else if (wait == Wait::No) {
        post(std::move(task));
    } else if (isMainThread()) {
        task();
    } else {
        const auto rendezvous = std::make_shared<Rendezvous>();
        post(Rendezvous::taskFor(rendezvous, std::move(task)));
        rendezvous->wait();
    }
}

}  // namespace orvane
