// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/udisks/BusCall.h"

#include "pellar/process/FileDescriptor.h"

#include <poll.h>
#include <sys/eventfd.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <utility>

namespace orvane {
namespace {

using Clock = std::chrono::steady_clock;
using std::chrono::milliseconds;

/// Makes a thread's wish to stop something that poll(2) hears.
class StopDescriptor {
public:
    explicit StopDescriptor(const std::stop_token& stop)
        : descriptor_(::eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK)), callback_(stop, [this] { wake(); })
    {
    }

    int get() const { return descriptor_.get(); }

private:
    void wake() const
    {
        const std::uint64_t one = 1;
        // It can only fail when it is written to already.
        static_cast<void>(!::write(descriptor_.get(), &one, sizeof one));
    }

    pellar::FileDescriptor descriptor_;
    std::stop_callback<std::function<void()>> callback_;
};

// poll(2) takes milliseconds, and -1 for no end.
int shorter(int timeout, std::optional<Clock::time_point> end)
{
    if (!end)
        return timeout;
    const auto left = std::chrono::ceil<milliseconds>(*end - Clock::now()).count();
    const int most = static_cast<int>(std::clamp<milliseconds::rep>(left, 0, 3600000));
    return timeout < 0 ? most : std::min(timeout, most);
}

sdbus::MethodCall callOf(sdbus::IProxy& proxy, const BusMethod& method)
{
#if ORVANE_SDBUS == 2
    return proxy.createMethodCall(sdbus::InterfaceName(method.interface),
                                  sdbus::MethodName(method.name));
#else
    return proxy.createMethodCall(method.interface, method.name);
#endif
}

template <class Handler>
sdbus::PendingAsyncCall send(sdbus::IProxy& proxy, const sdbus::MethodCall& call, Handler handler,
                             milliseconds timeout)
{
#if ORVANE_SDBUS == 2
    return proxy.callMethodAsync(call, std::move(handler), timeout);
#else
    return proxy.callMethod(call, std::move(handler), timeout);
#endif
}

bool processNext(sdbus::IConnection& connection)
{
#if ORVANE_SDBUS == 2
    return connection.processPendingEvent();
#else
    return connection.processPendingRequest();
#endif
}

}  // namespace

BusCall::BusCall(sdbus::IConnection& connection, const BusMethod& method,
                 const Arguments& arguments, milliseconds timeout)
    : connection_(connection),
      proxy_(sdbus::createProxy(connection, BusServiceName(method.service),
                                sdbus::ObjectPath(method.object)))
{
    sdbus::MethodCall call = callOf(*proxy_, method);
    arguments(call);
    pending_ = send(
        *proxy_, call,
        [this](const sdbus::MethodReply& reply, const auto& error) {
            if (error)
                answer_ = refusalOf(error->getName(), error->getMessage());
            else
                answer_ = reply;
        },
        timeout);
}

Result<sdbus::MethodReply, Refusal> BusCall::wait(const std::stop_token& stop,
                                                  std::optional<milliseconds> longest)
{
    const StopDescriptor stopped(stop);
    const auto end = longest ? std::optional(Clock::now() + *longest) : std::nullopt;
    while (true) {
        while (!answer_ && processNext(connection_)) {
        }
        if (answer_)
            return *std::exchange(answer_, std::nullopt);
        if (stop.stop_requested() || (end && Clock::now() >= *end))
            return Refusal{Refusal::Kind::Abandoned, {}};
        const auto bus = connection_.getEventLoopPollData();
        std::array<pollfd, 2> sources{pollfd{bus.fd, bus.events, 0},
                                      pollfd{stopped.get(), POLLIN, 0}};
        ::poll(sources.data(), sources.size(), shorter(bus.getPollTimeout(), end));
    }
}

}  // namespace orvane
