// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/loop/Notifications.h"

#include <utility>

namespace orvane {

void Notifications::addObserver(const void* observer, contract::Name name, Handler handler)
{
    registrations_.push_back(
        std::make_shared<Registration>(Registration{observer, name, std::move(handler)}));
}

void Notifications::removeObserver(const void* observer, contract::Name name)
{
    std::erase_if(registrations_, [&](const std::shared_ptr<Registration>& registration) {
        const bool isMeant = registration->observer == observer && registration->name == name;
        if (isMeant)
            registration->isInForce = false;
        return isMeant;
    });
}

void Notifications::post(const contract::Notification& notification)
{
    std::vector<std::shared_ptr<Registration>> receivers;
    for (const auto& registration : registrations_)
        if (registration->name == notification.name)
            receivers.push_back(registration);
    for (const auto& receiver : receivers)
        if (receiver->isInForce)
            receiver->handler(notification);
}

}  // namespace orvane
