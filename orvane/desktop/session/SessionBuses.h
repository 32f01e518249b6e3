// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QDBusConnection>

#include <functional>
#include <optional>

namespace orvane::desktop {

/// How the program gets at a D-Bus; none where there is none. Asked when the bus is needed.
using BusLookup = std::function<std::optional<QDBusConnection>()>;

/// None is used unless it is given.
struct SessionBuses {
    BusLookup session = [] {
        return std::optional<QDBusConnection>();
    };
    BusLookup system = session;
};

/// The buses of the user's session and of the system. Where no session bus runs, none is started.
[[nodiscard]] SessionBuses realBuses();

}  // namespace orvane::desktop
