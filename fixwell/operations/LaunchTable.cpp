// SPDX-License-Identifier: Apache-2.0
#include "fixwell/operations/LaunchTable.h"

#include "contract/foundation/Bundle.h"

namespace fixwell {
namespace {

constexpr std::string_view startingVerification = localizable("Starting verification tool: ");
constexpr std::string_view startingRepair = localizable("Starting repair tool: ");
constexpr std::string_view verifyFailed = localizable("Verify failed.");
constexpr std::string_view repairFailed = localizable("Repair failed.");

}  // namespace

const Launch launchVerifyDisk{
    FXWOperationVerifyDisk,
    localizable("Verifying volume “%@”"),
    startingVerification,
    verifyFailed,
    localizable("Verify volume failed: %@\n\n"),
    &PLRepairDisk::beginStoragesystemFilesystemVerifyForDisk,
};

const Launch launchRepairDisk{
    FXWOperationRepairDisk,
    localizable("Verify and Repair volume “%@”"),
    startingRepair,
    repairFailed,
    localizable("Repairing volume failed: %@\n\n"),
    &PLRepairDisk::beginStoragesystemFilesystemRepairForDisk,
};

const Launch launchVerifyPermissions{
    FXWOperationVerifyPermissions,
    localizable("Verifying permissions for “%@”"),
    {},
    verifyFailed,
    localizable("Verify permissions failed: %@\n\n"),
    &PLRepairDisk::beginPermissionsVerifyForDisk,
};

const Launch launchRepairPermissions{
    FXWOperationRepairPermissions,
    localizable("Repairing permissions for “%@”"),
    {},
    repairFailed,
    localizable("Repair permissions failed: %@\n\n"),
    &PLRepairDisk::beginPermissionsRepairForDisk,
};

const Launch launchVerifyPartitionMap{
    FXWOperationVerifyPartitionMap,
    localizable("Verifying partition map for “%@”"),
    startingVerification,
    verifyFailed,
    {},
    &PLRepairDisk::beginPartitionMapVerifyForDisk,
};

const Launch launchRepairPartitionMap{
    FXWOperationRepairPartitionMap,
    localizable("Verifying and repairing partition map for “%@”"),
    startingRepair,
    repairFailed,
    {},
    &PLRepairDisk::beginPartitionMapRepairForDisk,
};

ErrorCode restatedLaunchError(ErrorCode code, FXWOperationType type, const OVDisk& disk)
{
    if (code != kPLErrorDiskInUse || isPartitionMapOperation(type))
        return code;
    if (type == FXWOperationRepairDisk)
        return kOVErrorCannotRepairInUse;
    const bool asksForHome = type == FXWOperationVerifyDisk;
    if (disk.isBootVolume() || (asksForHome && disk.containUserHomeDirectory()))
        return kOVErrorSystemDiskInUse;
    return kOVErrorDiskInUse;
}

ErrorCode restatedFinishError(ErrorCode code, FXWOperationType type, const OVDisk* disk)
{
    if (code != kPLErrorDiskInUse)
        return code;
    if (type == FXWOperationRepairDisk)
        return kOVErrorCannotRepairInUse;
    if (disk != nullptr && (disk->isBootVolume() || disk->containUserHomeDirectory()))
        return kOVErrorSystemDiskInUse;
    return kOVErrorDiskInUse;
}

}  // namespace fixwell
