// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/udisks/Refusal.h"
#include "pellar/process/Command.h"

#include <chrono>
#include <memory>
#include <optional>
#include <set>
#include <stop_token>
#include <string>

namespace sdbus {
class IConnection;
class Variant;
}  // namespace sdbus

namespace orvane {

class BusCall;

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

    [[nodiscard]] Answer<> mount(const std::string& node);
    /// From all the places where it is mounted.
    [[nodiscard]] Answer<> unmount(const std::string& node);
    /// The medium of the device's drive. Nothing of it may be mounted.
    [[nodiscard]] Answer<> eject(const std::string& node);
    /// Takes the image from a loop device.
    [[nodiscard]] Answer<> detachLoop(const std::string& node);
    /// Makes a loop device of an open file, which is read only where the file is; its node.
    [[nodiscard]] Answer<std::string> setUpLoop(int file, pellar::Access access);

    /// Asks for the self-monitoring of all drives; the answer is taken later.
    void askForFailingDrives();
    /// The nodes of all devices whose drive says that it is failing; waits no longer than this.
    [[nodiscard]] Answer<std::set<std::string>> failingDrives(std::chrono::milliseconds longest);

private:
    Answer<std::string> objectOf(const std::string& node);
    Answer<sdbus::Variant> property(const std::string& object, const char* interface,
                                    const char* name);
    Answer<> call(const std::string& node, const char* interface, const char* method);
    Answer<> callObject(const std::string& object, const char* interface, const char* method);

    std::stop_token stop_;
    std::unique_ptr<sdbus::IConnection> connection_;  ///< none where there is no bus
    std::unique_ptr<BusCall> health_;
};

}  // namespace orvane
