// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/udisks/Refusal.h"
#include "pellar/process/Command.h"

#include <chrono>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <set>
#include <stop_token>
#include <string>
#include <vector>

namespace sdbus {
class IConnection;
class MethodCall;
class Variant;
}  // namespace sdbus

namespace orvane {

/// What a drive says of itself, as UDisks2 passes it on.
struct DriveHealth {
    // Of org.freedesktop.UDisks2.Drive.Ata.
    std::uint64_t smartUpdated = 0;  ///< seconds since the Epoch; 0: never read
    bool isSmartFailing = false;

    std::vector<std::string> nvmeWarnings;  ///< "SmartCriticalWarning" of an NVMe.Controller
};

/// A drive that is merely hot is not failing, and what was never read says nothing.
[[nodiscard]] bool isFailing(const DriveHealth& drive);

class BusCall;
struct BusMethod;

/// One conversation with UDisks2 over the system bus (UDisks2 reference manual). Where it needs a
/// password, the desktop asks the user for it. Each conversation has a connection of its own, so a
/// UDisks2 that was started again is found by the next one. One thread, never the main one: every
/// answer may take minutes. When `stop` asks for it, every wait ends with Abandoned.
class UDisks {
public:
    explicit UDisks(std::stop_token stop = {});
    UDisks(const UDisks&) = delete;
    UDisks& operator=(const UDisks&) = delete;
    ~UDisks();

    // All take the node of a block device ("/dev/sdb1").

    [[nodiscard]] Result<void, Refusal> mount(const std::string& node);
    /// From all the places where it is mounted.
    [[nodiscard]] Result<void, Refusal> unmount(const std::string& node);
    /// The medium of the device's drive. Nothing of it may be mounted.
    [[nodiscard]] Result<void, Refusal> eject(const std::string& node);
    /// Takes the image from a loop device.
    [[nodiscard]] Result<void, Refusal> detachLoop(const std::string& node);
    /// Makes a loop device of an open file, which is read only where the file is; its node.
    [[nodiscard]] Result<std::string, Refusal> setUpLoop(int file, pellar::Access access);

    /// Asks for the self-monitoring of all drives; the answer is taken later.
    void askForFailingDrives();
    /// The nodes of all devices whose drive says that it is failing; waits no longer than this.
    [[nodiscard]] Result<std::set<std::string>, Refusal> failingDrives(
        std::chrono::milliseconds longest);

private:
    // What goes wrong is thrown: a Refusal, or an error of the bus's library.

    template <class Value>
    Value ask(const BusMethod& method, const std::function<void(sdbus::MethodCall&)>& arguments,
              std::chrono::milliseconds time);
    std::string objectOf(const std::string& node);
    sdbus::Variant property(const std::string& object, const char* interface, const char* name);
    void call(const std::string& node, const char* interface, const char* method);
    void callObject(const std::string& object, const char* interface, const char* method);

    std::stop_token stop_;
    std::unique_ptr<sdbus::IConnection> connection_;  ///< none where there is no bus
    std::unique_ptr<BusCall> health_;
};

}  // namespace orvane
