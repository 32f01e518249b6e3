// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/NotificationCenter.h"
#include "contract/support/OVDisk.h"

#include <string_view>
#include <vector>

namespace contract {

// What the host posts when disks come, go and change; the object is the OVDisk.
inline const Name OVDiskAppearedNotification{"OVDiskAppearedNotification"};
inline const Name OVDiskUnmountedNotification{"OVDiskUnmountedNotification"};
inline const Name OVDiskChangedNotification{"OVDiskChangedNotification"};
inline const Name OVDiskEjectedNotification{"OVDiskEjectedNotification"};

/// The host's disks. Main thread only. A "synchronous" operation returns when it is done, any
/// other when it has been asked for.
class OVDiskController {
public:
    virtual ~OVDiskController() = default;

    /// None when no such disk is known.
    virtual OVDiskPointer diskWithIdentifier(std::string_view identifier) = 0;
    virtual OVDiskPointer diskWithKRDisk(const DiskReferencePointer& disk) = 0;
    /// Makes a disk object where the host knew none; none only for no reference.
    virtual OVDiskPointer findOrCreateOVDisk(const DiskReferencePointer& disk) = 0;
    /// The volumes of a disk that are shown to the user; empty for no disk.
    virtual std::vector<OVDiskPointer> viewablePartitions(const OVDiskPointer& disk) = 0;

    /// Does nothing for no disk, and for a disk that cannot be mounted.
    virtual void mountDisk(const OVDiskPointer& disk, bool includeChildren, bool synchronous) = 0;
    virtual void ejectDisk(const OVDiskPointer& disk, bool synchronous) = 0;

    /// Delivers `notification`, under the host's own name `name`, to the modules that are shown.
    virtual void notifyFrontmostModulesOnly(Name name, const Notification& notification) = 0;
};

}  // namespace contract
