// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/terminal/commands/Commands.h"

#include <array>
#include <string>

namespace orvane {

/// A command and the module's button that it presses.
struct ActionButton {
    Command command;
    const char* name;
    const char* outlet;
};

inline constexpr std::array<ActionButton, 4> actionButtons{{
    {Command::Verify, "verify", "verifyDiskButton"},
    {Command::Repair, "repair", "repairDiskButton"},
    {Command::VerifyPermissions, "verify-permissions", "verifyPermissionsButton"},
    {Command::RepairPermissions, "repair-permissions", "repairPermissionsButton"},
}};

const ActionButton& actionButtonFor(Command command);

/// Why the action cannot be used on the selected disk: that its drive is failing, the module's
/// reason, or that there is none to be had.
std::string unavailableReason(Session& session, const TerminalButton& button, const Disk& disk);

/// The same as a sentence that names the action and the disk.
std::string unavailableSentence(Session& session, const TerminalButton& button,
                                const NamedDisk& disk);

/// That an image's partition map is damaged, and what can be done about it.
std::string damagedMapSentence(Session& session, const NamedDisk& image);

}  // namespace orvane
