// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Bundle.h"
#include "contract/foundation/NotificationCenter.h"
#include "contract/foundation/RunLoop.h"
#include "contract/pellar/PLRepairDisk.h"
#include "contract/support/OVDiskController.h"
#include "contract/support/OVLog.h"
#include "contract/support/OVPreferences.h"
#include "contract/support/OVWindowController.h"
#include "contract/toolkit/Alert.h"
#include "contract/toolkit/Event.h"
#include "contract/toolkit/Help.h"
#include "contract/toolkit/Interface.h"
#include "contract/toolkit/Pasteboard.h"
#include "contract/toolkit/Printing.h"

#include <filesystem>
#include <memory>
#include <string>

namespace contract {

class OVModule;

/// Attaching a disk image: any thread, unlike the rest of the host.
class ImageAttachment {
public:
    virtual ~ImageAttachment() = default;

    /// Reads the image and prepares its disks; 0 on success. `result` then describes the
    /// attachment.
    [[nodiscard]] virtual ErrorCode AttachImageWithURL(const std::filesystem::path& image,
                                                       Dictionary& result) = 0;
    /// The whole disk of an attachment, with its volumes as children; none when it has gone.
    virtual OVDiskPointer TopLevelPLDiskForImageDict(const Dictionary& result) = 0;
};

/// Everything the host gives to its modules, handed to each when it is made. Nothing is reached
/// any other way. The services outlive the modules.
class HostServices {
public:
    virtual ~HostServices() = default;

    virtual OVPreferences& sharedPreferences() = 0;
    virtual OVDiskController& sharedDiskController() = 0;
    virtual OVLog& log() = 0;
    virtual NotificationCenter& defaultCenter() = 0;
    virtual RunLoop& mainRunLoop() = 0;
    virtual Threads& threads() = 0;
    virtual UserDefaults& standardUserDefaults() = 0;
    virtual Bundle& hostBundle() = 0;
    virtual ImageAttachment& imageAttachment() = 0;

    virtual Alerts& alerts() = 0;
    virtual Events& events() = 0;
    virtual HelpManager& sharedHelpManager() = 0;
    virtual InterfaceLoader& interfaceLoader() = 0;
    virtual Pasteboard& generalPasteboard() = 0;
    virtual Printing& printing() = 0;

    virtual std::unique_ptr<OVTimeEstimator> makeTimeEstimator() = 0;
    /// What an error code means, in the user's language; never empty.
    virtual std::string OVLocalizedErrorString(ErrorCode code) = 0;
    /// A number in the locale's decimal style, with its grouping separators.
    virtual std::string decimalString(const Value& number) = 0;
};

}  // namespace contract
