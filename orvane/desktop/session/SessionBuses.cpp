// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/session/SessionBuses.h"

#include "orvane/support/settings/XDGPaths.h"

#include <filesystem>

namespace orvane::desktop {
namespace {

std::optional<QDBusConnection> ifConnected(const QDBusConnection& bus)
{
    return bus.isConnected() ? std::optional(bus) : std::nullopt;
}

// Without an address, the library would start a bus of its own (dbus-launch(1)).
bool hasSessionBus()
{
    if (environmentValue("DBUS_SESSION_BUS_ADDRESS"))
        return true;
    const auto runtime = environmentValue("XDG_RUNTIME_DIR");
    std::error_code ignored;
    return runtime && std::filesystem::is_socket(std::filesystem::path(*runtime) / "bus", ignored);
}

}  // namespace

SessionBuses realBuses()
{
    return {
        [] { return hasSessionBus() ? ifConnected(QDBusConnection::sessionBus()) : std::nullopt; },
        [] {
            return ifConnected(QDBusConnection::systemBus());
        }};
}

}  // namespace orvane::desktop
