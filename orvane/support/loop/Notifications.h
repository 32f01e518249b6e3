// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/NotificationCenter.h"

#include <memory>
#include <vector>

namespace orvane {

/// The host's notification centre. Main thread only. An observer that is added in the middle of
/// a delivery hears of the next notification; one that is removed hears nothing more. A handler
/// may post.
class Notifications final : public contract::NotificationCenter {
public:
    void addObserver(const void* observer, contract::Name name, Handler handler) override;
    void removeObserver(const void* observer, contract::Name name) override;
    void post(const contract::Notification& notification) override;

private:
    struct Registration {
        const void* observer;
        contract::Name name;
        Handler handler;
        bool isInForce = true;
    };

    std::vector<std::shared_ptr<Registration>> registrations_;
};

}  // namespace orvane
