// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/udisks/UDisks.h"

#include "orvane/support/udisks/BusCall.h"
#include "orvane/support/udisks/DirectDisks.h"

#include <algorithm>
#include <map>
#include <utility>
#include <vector>

namespace orvane {

bool isFailing(const DriveFacts& drive)
{
    const auto& warnings = drive.nvmeWarnings;
    return (drive.ata.updated != 0 && drive.ata.isFailing) ||
           std::any_of(warnings.begin(), warnings.end(),
                       [](const std::string& warning) { return warning != "temperature"; });
}

std::set<std::string> failingDevices(const std::vector<DriveFacts>& drives,
                                     const std::vector<DeviceOfDrive>& devices)
{
    std::set<std::string> failing;
    for (const DriveFacts& drive : drives)
        if (isFailing(drive))
            failing.insert(drive.object);
    std::set<std::string> nodes;
    for (const DeviceOfDrive& device : devices)
        if (failing.contains(device.drive))
            nodes.insert(device.node);
    return nodes;
}

namespace {

using namespace std::chrono_literals;
using Options = std::map<std::string, sdbus::Variant>;
using Properties = std::map<std::string, sdbus::Variant>;
using Objects = std::map<sdbus::ObjectPath, std::map<std::string, Properties>>;

constexpr const char* root = "/org/freedesktop/UDisks2";
constexpr const char* manager = "/org/freedesktop/UDisks2/Manager";
constexpr std::chrono::milliseconds questionTime = 25s;
// A slow stick takes minutes to write back what is left, and a user to find the password.
constexpr std::chrono::milliseconds operationTime = 10min;

Options interactive()
{
    return {{"auth.no_user_interaction", sdbus::Variant(false)}};
}

Refusal noService()
{
    return {Refusal::Kind::NoService, {}};
}

// No exception of the bus's library leaves this file.
template <class Function>
auto answered(Function&& function) -> decltype(function())
{
    try {
        return function();
    } catch (const sdbus::Error& error) {
        return refusalOf(error.getName(), error.getMessage());
    }
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
    const auto found = object.find(std::string("org.freedesktop.UDisks2.") + name);
    return found != object.end() ? &found->second : nullptr;
}

DriveFacts driveFacts(const sdbus::ObjectPath& path,
                      const std::map<std::string, Properties>& object)
{
    DriveFacts drive{path, {}, {}};
    if (const auto* const ata = interfaceOf(object, "Drive.Ata"))
        drive.ata = {valueOf<std::uint64_t>(*ata, "SmartUpdated", 0),
                     valueOf(*ata, "SmartFailing", false)};
    // Since UDisks2 2.10.
    if (const auto* const nvme = interfaceOf(object, "NVMe.Controller"))
        drive.nvmeWarnings = valueOf(*nvme, "SmartCriticalWarning", std::vector<std::string>());
    return drive;
}

std::set<std::string> failingNodes(const Objects& objects)
{
    std::vector<DriveFacts> drives;
    std::vector<DeviceOfDrive> devices;
    for (const auto& [path, object] : objects) {
        drives.push_back(driveFacts(path, object));
        if (const auto* const block = interfaceOf(object, "Block"))
            devices.push_back({fileName(valueOf(*block, "Device", std::vector<std::uint8_t>())),
                               valueOf(*block, "Drive", sdbus::ObjectPath("/"))});
    }
    return failingDevices(drives, devices);
}

}  // namespace

UDisks::UDisks(std::stop_token stop) : stop_(std::move(stop))
{
    try {
        connection_ = sdbus::createSystemBusConnection();
    } catch (const sdbus::Error&) {
        // Without a bus every answer is that there is no service.
    }
}

UDisks::~UDisks() = default;

Answer<std::string> UDisks::objectOf(const std::string& node)
{
    if (!connection_)
        return noService();
    return answered([&]() -> Answer<std::string> {
        BusCall call(
            *connection_, {manager, "org.freedesktop.UDisks2.Manager", "ResolveDevice"},
            [&](sdbus::MethodCall& arguments) {
                arguments << Options{{"path", sdbus::Variant(node)}} << Options{};
            },
            questionTime);
        auto reply = call.wait(stop_);
        if (auto* const refusal = std::get_if<Refusal>(&reply))
            return *refusal;
        std::vector<sdbus::ObjectPath> objects;
        std::get<sdbus::MethodReply>(reply) >> objects;
        if (objects.empty())
            return Refusal{Refusal::Kind::UnknownDevice, {}};
        return std::string(objects.front());
    });
}

Answer<sdbus::Variant> UDisks::property(const std::string& object, const char* interface,
                                        const char* name)
{
    return answered([&]() -> Answer<sdbus::Variant> {
        BusCall question(
            *connection_, {object, "org.freedesktop.DBus.Properties", "Get"},
            [&](sdbus::MethodCall& arguments) {
                arguments << std::string("org.freedesktop.UDisks2.") +
                                 interface << std::string(name);
            },
            questionTime);
        auto reply = question.wait(stop_);
        if (const auto* const refusal = std::get_if<Refusal>(&reply))
            return *refusal;
        sdbus::Variant value;
        std::get<sdbus::MethodReply>(reply) >> value;
        return value;
    });
}

Answer<> UDisks::callObject(const std::string& object, const char* interface, const char* method)
{
    return answered([&]() -> Answer<> {
        BusCall call(
            *connection_, {object, std::string("org.freedesktop.UDisks2.") + interface, method},
            [](sdbus::MethodCall& arguments) { arguments << interactive(); }, operationTime);
        const auto reply = call.wait(stop_);
        if (const auto* const refusal = std::get_if<Refusal>(&reply))
            return *refusal;
        return Done{};
    });
}

Answer<> UDisks::call(const std::string& node, const char* interface, const char* method)
{
    const auto object = objectOf(node);
    if (const auto* const refusal = std::get_if<Refusal>(&object))
        return *refusal;
    return callObject(std::get<std::string>(object), interface, method);
}

Answer<> UDisks::mount(const std::string& node)
{
    return call(node, "Filesystem", "Mount");
}

// UDisks2 unmounts one place with each call.
Answer<> UDisks::unmount(const std::string& node)
{
    Answer<> answer = call(node, "Filesystem", "Unmount");
    for (auto left = placesOf(node).size(); left > 0 && answer.index() == 0; --left)
        answer = call(node, "Filesystem", "Unmount");
    return answer;
}

Answer<> UDisks::detachLoop(const std::string& node)
{
    return call(node, "Loop", "Delete");
}

Answer<std::string> UDisks::setUpLoop(int file, pellar::Access access)
{
    if (!connection_)
        return noService();
    sdbus::ObjectPath object;
    const auto made = answered([&]() -> Answer<> {
        BusCall call(
            *connection_, {manager, "org.freedesktop.UDisks2.Manager", "LoopSetup"},
            [&](sdbus::MethodCall& arguments) {
                Options options = interactive();
                options["read-only"] = sdbus::Variant(access == pellar::Access::ReadOnly);
                arguments << sdbus::UnixFd(file) << options;
            },
            operationTime);
        auto reply = call.wait(stop_);
        if (const auto* const refusal = std::get_if<Refusal>(&reply))
            return *refusal;
        std::get<sdbus::MethodReply>(reply) >> object;
        return Done{};
    });
    if (const auto* const refusal = std::get_if<Refusal>(&made))
        return *refusal;
    const auto device = property(object, "Block", "Device");
    if (const auto* const refusal = std::get_if<Refusal>(&device))
        return *refusal;
    return answered([&]() -> Answer<std::string> {
        return fileName(std::get<sdbus::Variant>(device).get<std::vector<std::uint8_t>>());
    });
}

Answer<> UDisks::eject(const std::string& node)
{
    const auto object = objectOf(node);
    if (const auto* const refusal = std::get_if<Refusal>(&object))
        return *refusal;
    const auto value = property(std::get<std::string>(object), "Block", "Drive");
    if (const auto* const refusal = std::get_if<Refusal>(&value))
        return *refusal;
    const auto drive = answered([&]() -> Answer<std::string> {
        return std::string(std::get<sdbus::Variant>(value).get<sdbus::ObjectPath>());
    });
    if (const auto* const refusal = std::get_if<Refusal>(&drive))
        return *refusal;
    const auto& path = std::get<std::string>(drive);
    return path == "/" ? Refusal{Refusal::Kind::CannotEject, {}}
                       : callObject(path, "Drive", "Eject");
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

Answer<std::set<std::string>> UDisks::failingDrives(std::chrono::milliseconds longest)
{
    if (!health_)
        return noService();
    return answered([&]() -> Answer<std::set<std::string>> {
        auto reply = health_->wait(stop_, longest);
        if (const auto* const refusal = std::get_if<Refusal>(&reply))
            return *refusal;
        Objects objects;
        std::get<sdbus::MethodReply>(reply) >> objects;
        return failingNodes(objects);
    });
}

}  // namespace orvane
