// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/support/HostServices.h"
#include "orvane/support/disks/DiskController.h"
#include "orvane/support/files/ActivityLog.h"
#include "orvane/support/history/DiskHistories.h"
#include "orvane/support/history/HistoryStore.h"
#include "orvane/support/images/ImageAttacher.h"
#include "orvane/support/loop/EventLoop.h"
#include "orvane/support/loop/Notifications.h"
#include "orvane/support/loop/WorkerThreads.h"
#include "orvane/support/settings/SettingsFile.h"
#include "orvane/support/settings/XDGPaths.h"
#include "orvane/support/texts/Catalogue.h"
#include "orvane/support/udisks/DiskOperations.h"
#include "orvane/support/udisks/DiskReader.h"

#include <filesystem>
#include <functional>
#include <memory>
#include <string>

namespace orvane {

/// What a front end decides about the services below it.
struct SupportOptions {
    XDGPaths paths = userXDGPaths();
    std::filesystem::path hostBundle;  ///< the directory with the host's `locale`
    int keptLogLevel = contract::OVLog::error;
    int shownLogLevel = 0;  ///< developers' lines up to this level also go to standard error
    bool keepsHistory = true;
    HistoryStore::Limits historyLimits = {};

    /// Long histories come in two steps, the newest records first; called when one is complete.
    /// None: each is read at once.
    std::function<void()> historyCompleted;

    /// What the installed tools can do; nothing unless told.
    CapabilityLookup capabilities = [](std::string_view) {
        return FilesystemCapabilities();
    };
    /// The text of an error code; "error CODE" where it answers nothing.
    std::function<std::string(contract::ErrorCode)> errorText;
    /// Also told what goes to the log, once for each thing that does not work.
    WarningSink warn;
};

/// The host's services that need no toolkit. A front end derives from it and adds those that do.
/// Main thread; the loop must outlive it.
class SupportHost : public contract::HostServices {
public:
    SupportHost(SupportOptions options, EventLoop& loop);
    SupportHost(const SupportHost&) = delete;
    SupportHost& operator=(const SupportHost&) = delete;
    /// Waits for worker threads and saves what is unsaved.
    ~SupportHost() override;

    contract::OVPreferences& sharedPreferences() override { return preferences_; }
    DiskController& sharedDiskController() override { return disks_; }
    ActivityLog& log() override { return log_; }
    Notifications& defaultCenter() override { return center_; }
    EventLoop& mainRunLoop() override { return loop_; }
    WorkerThreads& threads() override { return threads_; }
    SettingsFile& standardUserDefaults() override { return settings_; }
    ModuleBundle& hostBundle() override { return bundle_; }
    ImageAttacher& imageAttachment() override { return images_; }

    std::unique_ptr<contract::OVTimeEstimator> makeTimeEstimator() override;
    std::string OVLocalizedErrorString(contract::ErrorCode code) override;
    std::string decimalString(const contract::Value& number) override;

    const Translator& translator() const { return translator_; }
    HistoryStore& historyStore() { return store_; }
    DiskHistories& histories() { return histories_; }

    /// Mounts, unmounts and ejects devices.
    DiskOperations& diskOperations() { return operations_; }

    /// Reads the system's disks anew and tells what has changed.
    void refreshDisks();

private:
    void warn(const std::string& sentence);
    void connectDisks();
    Result<void, Failure> start(DiskAction action, const Disk& disk);
    std::vector<std::string> devicesWith(const std::string& uuid) const;
    void loadHistoriesLater();
    void loadHistories();

    SupportOptions options_;
    EventLoop& loop_;
    ModuleBundle bundle_;
    Translator translator_;
    ActivityLog log_;
    SettingsFile settings_;
    Preferences preferences_;
    Notifications center_;
    HistoryStore store_;
    DiskHistories histories_;
    DiskController disks_;
    DiskReader reader_;
    ImageAttacher images_;
    DiskOperations operations_;
    std::shared_ptr<bool> isThere_ = std::make_shared<bool>(true);  ///< for tasks that come later
    WorkerThreads threads_;  ///< last: no worker may be left when the others go
};

}  // namespace orvane
