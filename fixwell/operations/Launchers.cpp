// SPDX-License-Identifier: Apache-2.0
#include "fixwell/jobs/ActionListEntry.h"
#include "fixwell/module/OVFXW.h"
#include "fixwell/operations/LaunchTable.h"

namespace fixwell {

ErrorCode OVFXW::doVerifyDisk(const OVDiskPointer& disk)
{
    return launchOperation(launchVerifyDisk, disk);
}

ErrorCode OVFXW::doRepairDisk(const OVDiskPointer& disk)
{
    return launchOperation(launchRepairDisk, disk);
}

ErrorCode OVFXW::doVerifyPermissions(const OVDiskPointer& disk)
{
    return launchOperation(launchVerifyPermissions, disk);
}

ErrorCode OVFXW::doRepairPermissions(const OVDiskPointer& disk)
{
    return launchOperation(launchRepairPermissions, disk);
}

ErrorCode OVFXW::doVerifyPartitionMap(const OVDiskPointer& disk)
{
    return launchOperation(launchVerifyPartitionMap, disk);
}

ErrorCode OVFXW::doRepairPartitionMap(const OVDiskPointer& disk)
{
    return launchOperation(launchRepairPartitionMap, disk);
}

ErrorCode OVFXW::launchOperation(const Launch& launch, const OVDiskPointer& disk)
{
    const std::string title =
        localizedFormat(launch.title, disk ? disk->displayName() : std::string());
    ov_log(OVLog::trace, "%@\n", title);
    windowController().setGlobalProgressText(title);
    createStartupObject(title, disk);

    bool wasMounted = false;
    if (!isPartitionMapOperation(launch.operationType))
        wasMounted = noteMountState(disk);
    inflightItem.set(kFXW_OperationType, static_cast<std::int64_t>(launch.operationType));
    if (isPermissionOperation(launch.operationType))
        setupRunTimer();

    const DiskReferencePointer reference = disk ? disk->theKRDisk() : nullptr;
    if (!reference)
        return kPLErrorNoDiskReference;
    if (!launch.startLogLine.empty())
        host().log().log(localized(launch.startLogLine));
    const ErrorCode code = (repairDiskTool().*launch.begin)(reference);
    return code == kPLNoError ? code : reportFailedLaunch(launch, disk, code, wasMounted);
}

bool OVFXW::noteMountState(const OVDiskPointer& disk)
{
    const bool isMounted = disk && hasMountPoint(*disk);
    inflightItem.set(kEntryDiskWasMounted, isMounted);
    if (isMounted)
        if (const OVFilesystem* const filesystem = disk->filesystem())
            inflightItem.set(kEntryIsQVFS, filesystem->filesystemType() == "qvfs");
    return isMounted;
}

ErrorCode OVFXW::reportFailedLaunch(const Launch& launch, const OVDiskPointer& disk, ErrorCode code,
                                    bool wasMounted)
{
    windowController().setGlobalProgressText(localized(launch.failureProgressText));
    if (!isPartitionMapOperation(launch.operationType)) {
        if (code == kPLErrorCouldNotUnmount) {
            const std::string text = localizedFormat(
                localizable("The disk “%@” could not be unmounted"), disk->displayName());
            appendErrorTitleToMessageText(format("%@\n", {text}));
        } else {
            code = restatedLaunchError(code, launch.operationType, *disk);
            appendErrorToMessageText(
                localizedFormat(launch.failureText, host().OVLocalizedErrorString(code)));
            if (wasMounted && !hasMountPoint(*disk))
                diskController().mountDisk(disk, false, false);
        }
    }
    createDiskSummaryRecord();
    return code;
}

bool OVFXW::canVerifyPartitionMap(const OVDiskPointer& disk)
{
    if (!disk)
        return false;
    ErrorCode error = kPLNoError;
    return repairDiskTool().canRepairPartitionMapForDisk(disk->theKRDisk(), &error) &&
           error == kPLNoError;
}

// The library answers one question for both; a map that it can read right it can also restore.
bool OVFXW::canRepairPartitionMap(const OVDiskPointer& disk)
{
    return canVerifyPartitionMap(disk);
}

}  // namespace fixwell
