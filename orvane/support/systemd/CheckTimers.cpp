// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/systemd/CheckTimers.h"

#include "orvane/support/udisks/BusCall.h"

#include <algorithm>
#include <charconv>
#include <system_error>
#include <utility>

namespace orvane {
namespace {

using Clock = std::chrono::steady_clock;
using std::chrono::milliseconds;
/// A unit of ListUnitsByPatterns: its name is the first, its object the seventh.
using Unit =
    sdbus::Struct<std::string, std::string, std::string, std::string, std::string, std::string,
                  sdbus::ObjectPath, std::uint32_t, std::string, sdbus::ObjectPath>;

constexpr std::string_view prefix = "fixwell-check@";
constexpr std::string_view suffix = ".timer";
constexpr const char* service = "org.freedesktop.systemd1";
constexpr std::size_t mostTimers = 256;  // what more there are is not asked about

/// The conversation with the manager, which is over at a fixed time.
class TimerQuestions {
public:
    TimerQuestions(sdbus::IConnection& connection, const std::stop_token& stop)
        : connection_(connection), stop_(stop), end_(Clock::now() + std::chrono::seconds(2))
    {
    }

    /// None where there was no answer.
    template <class Value>
    std::optional<Value> ask(const BusMethod& method, const BusCall::Arguments& arguments)
    {
        const auto left = std::chrono::duration_cast<milliseconds>(end_ - Clock::now());
        if (left <= milliseconds(0))
            return std::nullopt;
        BusCall call(connection_, method, arguments, left);
        auto reply = call.wait(stop_, left);
        if (!reply)
            return std::nullopt;
        Value value;
        *reply >> value;
        return value;
    }

private:
    sdbus::IConnection& connection_;
    const std::stop_token& stop_;
    const Clock::time_point end_;
};

std::vector<Unit> waitingTimers(TimerQuestions& manager)
{
    const std::vector<std::string> states{"active"};
    const std::vector<std::string> patterns{std::string(prefix) + "*" + std::string(suffix)};
    auto units = manager
                     .ask<std::vector<Unit>>(
                         {"/org/freedesktop/systemd1", "org.freedesktop.systemd1.Manager",
                          "ListUnitsByPatterns", service},
                         [&](sdbus::MethodCall& call) { call << states << patterns; })
                     .value_or(std::vector<Unit>());
    if (units.size() > mostTimers)
        units.resize(mostTimers);
    return units;
}

/// In microseconds since 1970; 0, or the largest number, where it is not waiting for a time.
std::uint64_t nextElapseOf(const Unit& unit, TimerQuestions& manager)
{
    const auto value = manager.ask<sdbus::Variant>(
        {std::get<6>(unit), "org.freedesktop.DBus.Properties", "Get", service},
        [](sdbus::MethodCall& call) {
            call << std::string("org.freedesktop.systemd1.Timer")
                 << std::string("NextElapseUSecRealtime");
        });
    return value && value->containsValueOfType<std::uint64_t>() ? value->get<std::uint64_t>() : 0;
}

bool isMeant(const std::string& name, const DiskFacts& facts)
{
    if (name == "all")
        return !facts.isWhole && facts.storage == contract::DiskReference::Storage::BlockDevice;
    if (name.starts_with("LABEL="))
        return name.substr(6) == facts.label;
    if (name.starts_with("UUID="))
        return name.substr(5) == facts.uuid;
    std::error_code error;
    return name == facts.path || std::filesystem::canonical(name, error) == facts.path;
}

bool isMeant(const std::string& name, const Disk& disk)
{
    if (isMeant(name, disk.facts()))
        return true;
    const auto parent = std::dynamic_pointer_cast<Disk>(disk.parentDisk());
    return parent && isMeant(name, parent->facts());
}

bool wouldBeSkipped(const Disk& disk)
{
    const auto* const filesystem = disk.filesystem();
    return filesystem == nullptr || !filesystem->canBeVerified() || disk.hasSMARTError() ||
           (disk.isMounted() && !filesystem->supportsLiveVerify());
}

}  // namespace

// unit_name_unescape: a dash is a slash, "\x2d" one byte (systemd.unit(5), "String Escaping for
// Inclusion in Unit Names").
std::string nameOfInstance(std::string_view instance)
{
    std::string name;
    for (std::size_t i = 0; i < instance.size(); ++i) {
        unsigned int byte = 0;
        const std::string_view digits = instance.substr(std::min(i + 2, instance.size()), 2);
        const bool isEscape =
            instance.substr(i, 2) == "\\x" && digits.size() == 2 &&
            std::from_chars(digits.begin(), digits.end(), byte, 16).ptr == digits.end();
        if (isEscape)
            i += 3;
        name += isEscape ? static_cast<char>(byte) : instance[i] == '-' ? '/' : instance[i];
    }
    return name.starts_with("dev/") ? "/" + name : name;
}

std::vector<CheckTimer> readCheckTimers(const std::stop_token& stop)
{
    std::vector<CheckTimer> timers;
    try {
        const auto connection = sdbus::createSystemBusConnection();
        TimerQuestions manager(*connection, stop);
        for (const Unit& unit : waitingTimers(manager)) {
            std::string_view instance = std::get<0>(unit);
            if (!instance.starts_with(prefix) || !instance.ends_with(suffix))
                continue;
            instance.remove_prefix(prefix.size());
            instance.remove_suffix(suffix.size());
            const std::uint64_t next = nextElapseOf(unit, manager);
            constexpr std::uint64_t latest = 253402300799000000;  // the end of the year 9999
            if (next != 0 && next <= latest)
                timers.push_back({nameOfInstance(instance), std::chrono::system_clock::time_point(
                                                                std::chrono::microseconds(next))});
        }
    } catch (const sdbus::Error&) {
        // There is no bus, or it went away: what is known until then.
    }
    return timers;
}

std::optional<std::chrono::system_clock::time_point> nextCheckOf(
    const Disk& disk, const std::vector<CheckTimer>& timers)
{
    std::optional<std::chrono::system_clock::time_point> next;
    if (wouldBeSkipped(disk))
        return next;
    for (const CheckTimer& timer : timers)
        if ((!next || timer.next < *next) && isMeant(timer.disk, disk))
            next = timer.next;
    return next;
}

}  // namespace orvane
