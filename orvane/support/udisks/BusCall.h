// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/udisks/Refusal.h"

#include <sdbus-c++/sdbus-c++.h>

#include <chrono>
#include <functional>
#include <memory>
#include <optional>
#include <stop_token>

namespace orvane {

// Version 2 of sdbus-c++ (Debian 13) has types of its own for what are strings in version 1
// (Debian 12), and other names for some functions.
#if __has_include(<sdbus-c++/VTableItems.h>)
#define ORVANE_SDBUS 2
using BusServiceName = sdbus::ServiceName;
#else
#define ORVANE_SDBUS 1
using BusServiceName = std::string;
#endif

/// What is called: a method of UDisks2, or of another service of the bus.
struct BusMethod {
    std::string object;
    std::string interface;
    std::string name;
    std::string service = "org.freedesktop.UDisks2";
};

/// One call of a service and the wait for its answer. One thread; the connection outlives it.
class BusCall {
public:
    using Arguments = std::function<void(sdbus::MethodCall& call)>;

    /// Sends the call at once. Throws sdbus::Error where that is not possible.
    BusCall(sdbus::IConnection& connection, const BusMethod& method, const Arguments& arguments,
            std::chrono::milliseconds timeout);
    BusCall(const BusCall&) = delete;
    BusCall& operator=(const BusCall&) = delete;
    ~BusCall() { pending_.cancel(); }

    /// Waits until the service has answered, the call's time is over, `longest` has passed, or the
    /// thread is asked to stop: the last two are Abandoned, and what the service does goes on. The
    /// answer borrows from the connection. Throws sdbus::Error when the bus goes away.
    [[nodiscard]] Result<sdbus::MethodReply, Refusal> wait(
        const std::stop_token& stop,
        std::optional<std::chrono::milliseconds> longest = std::nullopt);

private:
    sdbus::IConnection& connection_;
    std::unique_ptr<sdbus::IProxy> proxy_;
    std::optional<Result<sdbus::MethodReply, Refusal>> answer_;
    sdbus::PendingAsyncCall pending_;
};

}  // namespace orvane
