// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <string_view>

namespace contract {

// The names by which the checking module, its interface file and the front ends know the same
// controls. A front end that offers an action in its menus or as a command presses the button.

namespace outlet {
inline constexpr std::string_view instructionalText = "instructionalTextField";
inline constexpr std::string_view repairMessageText = "repairMessageTextView";
inline constexpr std::string_view verifyDisk = "verifyDiskButton";
inline constexpr std::string_view repairDisk = "repairDiskButton";
inline constexpr std::string_view verifyPermissions = "verifyPermissionsButton";
inline constexpr std::string_view repairPermissions = "repairPermissionsButton";
inline constexpr std::string_view showDetails = "showDetailsButton";
inline constexpr std::string_view clearHistory = "clearHistoryButton";
inline constexpr std::string_view messageOutline = "messageOutlineView";

/// The buttons that begin an action on the selection, and stop it while it runs.
inline constexpr std::array actions{verifyDisk, repairDisk, verifyPermissions, repairPermissions};
}  // namespace outlet

// The actions that the controls send.
namespace selector {
inline constexpr std::string_view verifyDisk = "verifyDisk:";
inline constexpr std::string_view repairDisk = "repairDisk:";
inline constexpr std::string_view verifyPermissions = "verifyPermissions:";
inline constexpr std::string_view repairPermissions = "repairPermissions:";
inline constexpr std::string_view stop = "stopAction:";
inline constexpr std::string_view showDetails = "showDetailsAction:";
inline constexpr std::string_view clearHistory = "clearHistoryAction:";
inline constexpr std::string_view help = "helpButtonAction:";
inline constexpr std::string_view deleteSelected = "deleteSelected:";
}  // namespace selector

/// The custom view that the interface file asks of the module: its message log.
inline constexpr std::string_view messageOutlineViewClass = "OVFXWMessageOutlineView";

}  // namespace contract
