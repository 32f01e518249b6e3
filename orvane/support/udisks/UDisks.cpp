// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/udisks/UDisks.h"

#include "orvane/support/udisks/BusCall.h"
#include "orvane/support/udisks/DirectDisks.h"

#include <algorithm>
#include <map>
#include <type_traits>
#include <utility>
#include <vector>

namespace orvane {

namespace {

using namespace std::chrono_literals;
using Options = std::map<std::string, sdbus::Variant>;
using Properties = std::map<std::string, sdbus::Variant>;
using Objects = std::map<sdbus::ObjectPath, std::map<std::string, Properties>>;

const std::string interfaces = "org.freedesktop.UDisks2.";
constexpr const char* root = "/org/freedesktop/UDisks2";
constexpr const char* manager = "/org/freedesktop/UDisks2/Manager";
constexpr std::chrono::milliseconds questionTime = 25s;
// A slow stick takes minutes to write back what is left, and a user to find the password.
constexpr std::chrono::milliseconds operationTime = 10min;

Options interactive()
{
    return {{"auth.no_user_interaction", sdbus::Variant(false)}};
}

// No exception leaves this file, neither one of the bus's library nor a Refusal.
template <class Function>
auto answerOf(Function&& function) -> Result<decltype(function()), Refusal>
{
    try {
        if constexpr (std::is_void_v<decltype(function())>) {
            function();
            return {};
        } else {
            return function();
        }
    } catch (const Refusal& refusal) {
        return refusal;
    } catch (const sdbus::Error& error) {
        return refusalOf(error.getName(), error.getMessage());
    }
}

sdbus::MethodReply replyIn(Result<sdbus::MethodReply, Refusal> answer)
{
    if (!answer)
        throw answer.error();
    return *std::move(answer);
}

template <class T>
T valueOf(const Properties& properties, const char* name, T otherwise)
{
    const auto found = properties.find(name);
    return found != properties.end() && found->second.containsValueOfType<T>()
               ? found->second.get<T>()
               : otherwise;
}

// "ay" with a zero at the end, as all file names of UDisks2 are.
std::string fileName(const std::vector<std::uint8_t>& bytes)
{
    std::string text(bytes.begin(), bytes.end());
    text.resize(std::min(text.find('\0'), text.size()));
    return text;
}

const Properties* interfaceOf(const std::map<std::string, Properties>& object, const char* name)
{
    const auto found = object.find(interfaces + name);
    return found != object.end() ? &found->second : nullptr;
}

DriveHealth healthOf(const std::map<std::string, Properties>& object)
{
    DriveHealth drive;
    if (const auto* const ata = interfaceOf(object, "Drive.Ata")) {
        drive.smartUpdated = valueOf<std::uint64_t>(*ata, "SmartUpdated", 0);
        drive.isSmartFailing = valueOf(*ata, "SmartFailing", false);
    }
    // Since UDisks2 2.10.
    if (const auto* const nvme = interfaceOf(object, "NVMe.Controller"))
        drive.nvmeWarnings = valueOf(*nvme, "SmartCriticalWarning", std::vector<std::string>());
    return drive;
}

/// The nodes of those devices, whole or parts, whose drive is failing.
std::set<std::string> failingNodes(const Objects& objects)
{
    std::set<std::string> nodes;
    for (const auto& [path, object] : objects) {
        const auto* const block = interfaceOf(object, "Block");
        const auto drive = block != nullptr
                               ? objects.find(valueOf(*block, "Drive", sdbus::ObjectPath("/")))
                               : objects.end();
        if (drive != objects.end() && isFailing(healthOf(drive->second)))
            nodes.insert(fileName(valueOf(*block, "Device", std::vector<std::uint8_t>())));
    }
    return nodes;
}

}  // namespace

bool isFailing(const DriveHealth& drive)
{
    const auto& warnings = drive.nvmeWarnings;
    return (drive.smartUpdated != 0 && drive.isSmartFailing) ||
           std::any_of(warnings.begin(), warnings.end(),
                       [](const std::string& warning) { return warning != "temperature"; });
}

UDisks::UDisks(std::stop_token stop) : stop_(std::move(stop))
{
    try {
        connection_ = sdbus::createSystemBusConnection();
    } catch (const sdbus::Error&) {
        // Without a bus every answer is that there is no service.
    }
}

UDisks::~UDisks() = default;

template <class Value>
Value UDisks::ask(const BusMethod& method, const BusCall::Arguments& arguments,
                  std::chrono::milliseconds time)
{
    if (!connection_)
        throw Refusal{Refusal::Kind::NoService, {}};
    BusCall call(*connection_, method, arguments, time);
    auto reply = replyIn(call.wait(stop_));
    Value value;
    reply >> value;
    return value;
}

std::string UDisks::objectOf(const std::string& node)
{
    const auto objects = ask<std::vector<sdbus::ObjectPath>>(
        {manager, "org.freedesktop.UDisks2.Manager", "ResolveDevice"},
        [&](sdbus::MethodCall& arguments) {
            arguments << Options{{"path", sdbus::Variant(node)}} << Options{};
        },
        questionTime);
    if (objects.empty())
        throw Refusal{Refusal::Kind::UnknownDevice, {}};
    return objects.front();
}

sdbus::Variant UDisks::property(const std::string& object, const char* interface, const char* name)
{
    return ask<sdbus::Variant>(
        {object, "org.freedesktop.DBus.Properties", "Get"},
        [&](sdbus::MethodCall& arguments) {
            arguments << interfaces + interface << std::string(name);
        },
        questionTime);
}

void UDisks::callObject(const std::string& object, const char* interface, const char* method)
{
    BusCall call(
        *connection_, {object, interfaces + interface, method},
        [](sdbus::MethodCall& arguments) { arguments << interactive(); }, operationTime);
    replyIn(call.wait(stop_));
}

void UDisks::call(const std::string& node, const char* interface, const char* method)
{
    callObject(objectOf(node), interface, method);
}

Result<void, Refusal> UDisks::mount(const std::string& node)
{
    return answerOf([&] { call(node, "Filesystem", "Mount"); });
}

// UDisks2 unmounts one place with each call.
Result<void, Refusal> UDisks::unmount(const std::string& node)
{
    return answerOf([&] {
        call(node, "Filesystem", "Unmount");
        for (auto left = placesOf(node).size(); left > 0; --left)
            call(node, "Filesystem", "Unmount");
    });
}

Result<void, Refusal> UDisks::detachLoop(const std::string& node)
{
    return answerOf([&] { call(node, "Loop", "Delete"); });
}

Result<std::string, Refusal> UDisks::setUpLoop(int file, pellar::Access access)
{
    return answerOf([&] {
        const auto object = ask<sdbus::ObjectPath>(
            {manager, "org.freedesktop.UDisks2.Manager", "LoopSetup"},
            [&](sdbus::MethodCall& arguments) {
                Options options = interactive();
                options["read-only"] = sdbus::Variant(access == pellar::Access::ReadOnly);
                arguments << sdbus::UnixFd(file) << options;
            },
            operationTime);
        return fileName(property(object, "Block", "Device").get<std::vector<std::uint8_t>>());
    });
}

Result<void, Refusal> UDisks::eject(const std::string& node)
{
    return answerOf([&] {
        const auto drive = property(objectOf(node), "Block", "Drive").get<sdbus::ObjectPath>();
        if (drive == "/")
            throw Refusal{Refusal::Kind::CannotEject, {}};
        callObject(drive, "Drive", "Eject");
    });
}

void UDisks::askForFailingDrives()
{
    if (!connection_)
        return;
    try {
        health_ = std::make_unique<BusCall>(
            *connection_,
            BusMethod{root, "org.freedesktop.DBus.ObjectManager", "GetManagedObjects"},
            [](sdbus::MethodCall&) {}, questionTime);
    } catch (const sdbus::Error&) {
        health_.reset();
    }
}

Result<std::set<std::string>, Refusal> UDisks::failingDrives(std::chrono::milliseconds longest)
{
    return answerOf([&] {
        if (!health_)
            throw Refusal{Refusal::Kind::NoService, {}};
        auto reply = replyIn(health_->wait(stop_, longest));
        Objects objects;
        reply >> objects;
        return failingNodes(objects);
    });
}

}  // namespace orvane
