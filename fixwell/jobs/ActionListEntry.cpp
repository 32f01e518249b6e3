// SPDX-License-Identifier: Apache-2.0
#include "fixwell/jobs/ActionListEntry.h"

namespace fixwell {

Dictionary makeActionListEntry(const OVDiskPointer& disk, FXWAction action)
{
    return Dictionary::of({{kEntryDiskIdentifier, disk->diskIdentifier()},
                           {kEntryVolumeName, disk->displayName()},
                           {kEntryAction, static_cast<std::int64_t>(action)},
                           {kEntryDisk, disk}});
}

OVDiskPointer diskOfEntry(const Dictionary& entry)
{
    return entry[kEntryDisk].object<OVDisk>();
}

}  // namespace fixwell
