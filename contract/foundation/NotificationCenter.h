// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Dictionary.h"
#include "contract/foundation/Name.h"
#include "contract/foundation/Value.h"

#include <functional>
#include <memory>

namespace contract {

/// Something happened (`name`) to somebody (`object`, may be none).
struct Notification {
    Name name;
    std::shared_ptr<Object> object;
    Dictionary userInfo;
};

/// Delivers notifications at once, on the main thread, in the order of registration.
class NotificationCenter {
public:
    using Handler = std::function<void(const Notification&)>;

    virtual ~NotificationCenter() = default;

    /// `observer` is only an identity, to take the registration away again; it is never
    /// followed. Registering twice under one name delivers twice.
    virtual void addObserver(const void* observer, Name name, Handler handler) = 0;
    /// Takes every registration of `observer` under `name` away; effective at once, also in the
    /// middle of a delivery.
    virtual void removeObserver(const void* observer, Name name) = 0;
    virtual void post(const Notification& notification) = 0;
};

}  // namespace contract
