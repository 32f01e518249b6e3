// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/support/OVModule.h"
#include "fixwell/Contract.h"
#include "tests/module/FakeControls.h"

#include <algorithm>
#include <functional>
#include <map>
#include <memory>
#include <string>
#include <vector>

namespace fixwell::testing {

/// What the module asked of the host, in order.
using Journal = std::vector<std::string>;

/// What a test says of a disk; a volume that is not mounted, with everything in order.
struct FakeFacts {
    std::int32_t type = 3;
    std::int64_t number = 0;
    bool whole = false;
    std::optional<std::string> mount = {};
    bool writable = true;
    bool boot = false;
    bool home = false;
    bool smartError = false;
    bool dvdRAM = false;
    bool blankMedia = false;
    bool offlineImage = false;
    std::string imagePath = {};
    bool ownership = true;
    bool permissionsRepairable = true;
    std::string format = "ext4";
    bool repairs = true;
    bool verifies = true;
    bool verifiesLive = false;
};

struct FakeDisk final : OVDisk, OVFilesystem, FakeFacts {
    explicit FakeDisk(std::string id, const FakeFacts& facts = {})
        : FakeFacts(facts), identifier(std::move(id)), name(identifier)
    {
        auto made = std::make_shared<DiskReference>();
        made->identifier = identifier;
        made->path = "/dev/" + identifier;
        reference = made;
    }

    std::string identifier;
    std::string name;
    std::weak_ptr<OVDisk> parent;
    std::vector<OVDiskPointer> volumes;
    DiskReferencePointer reference;
    Array history;

    std::string diskIdentifier() const override { return identifier; }
    std::string displayName() const override { return name; }
    std::int32_t diskType() const override { return type; }
    std::int64_t diskNumber() const override { return number; }
    bool isWhole() const override { return whole; }
    OVDiskPointer parentDisk() const override { return parent.lock(); }
    std::vector<OVDiskPointer> children() const override { return volumes; }
    std::optional<std::string> mountPoint() const override { return mount; }
    bool isMounted() const override { return mount.has_value(); }
    bool isWritableVolume() const override { return writable; }
    bool isBootVolume() const override { return boot; }
    bool containUserHomeDirectory() const override { return home; }
    bool hasSMARTError() const override { return smartError; }
    bool isDVDRAM() const override { return dvdRAM; }
    bool hasBlankOpticalMedia() const override { return blankMedia; }
    bool isOfflineDiskImage() const override { return offlineImage; }
    std::string diskImagePath() const override { return imagePath; }
    bool permissionsEnabled() const override { return ownership; }
    bool canRepairPermissions() const override { return permissionsRepairable; }
    const OVFilesystem* filesystem() const override { return this; }
    std::string filesystemType() const override { return format; }
    bool canBeRepaired() const override { return repairs; }
    bool canBeVerified() const override { return verifies; }
    bool supportsLiveVerify() const override { return verifiesLive; }
    DiskReferencePointer theKRDisk() const override { return reference; }
    Array fsckHistory() const override;
    Array fsckHistoryNoChildren() const override { return history; }
    void setFsckHistory(const Array& records) override { history = records; }
    bool clearFsckHistory() override
    {
        const bool hadSome = !history.isEmpty();
        if (hadSome)
            history.removeAll();
        return hadSome;
    }
};

struct FakeEstimator final : OVTimeEstimator {
    explicit FakeEstimator(std::string& answer, Journal& journal)
        : answer_(answer), journal_(journal)
    {
    }
    void setStartTimeWithPercentComplete(Threads::Date start, double percent) override;
    std::string timeEstimateString(double) override { return answer_; }

private:
    std::string& answer_;
    Journal& journal_;
};

/// The disk-management library: notes what it is asked, starts what it is not told to refuse.
struct FakeRepairDisk final : PLRepairDisk {
    using Disk = const DiskReferencePointer&;
    explicit FakeRepairDisk(struct FakeHost& owner) : host(owner) {}

    ErrorCode beginStoragesystemFilesystemVerifyForDisk(Disk disk) override
    {
        return begin("verify", disk);
    }
    ErrorCode beginStoragesystemFilesystemRepairForDisk(Disk disk) override
    {
        return begin("repair", disk);
    }
    ErrorCode beginPermissionsVerifyForDisk(Disk disk) override
    {
        return begin("verify permissions", disk);
    }
    ErrorCode beginPermissionsRepairForDisk(Disk disk) override
    {
        return begin("repair permissions", disk);
    }
    ErrorCode beginPartitionMapVerifyForDisk(Disk disk) override
    {
        return begin("verify map", disk);
    }
    ErrorCode beginPartitionMapRepairForDisk(Disk disk) override
    {
        return begin("repair map", disk);
    }
    bool canRepairPartitionMapForDisk(Disk disk, ErrorCode* error) override;
    bool canRepairStoragesystemFilesystemForDisk(Disk, ErrorCode*) override;
    bool canVerifyStoragesystemFilesystemForDisk(Disk, ErrorCode*) override;
    void cancelCurrentOperation() override;

    ErrorCode begin(const char* what, Disk disk);

    struct FakeHost& host;
};

/// A whole host in miniature, with a journal of what the module asked it to do.
struct FakeHost : HostServices,
                  ModuleSite,
                  OVPreferences,
                  OVDiskController,
                  OVLog,
                  NotificationCenter,
                  RunLoop,
                  Threads,
                  UserDefaults,
                  Bundle,
                  ImageAttachment,
                  Alerts,
                  Events,
                  HelpManager,
                  InterfaceLoader,
                  Pasteboard,
                  Printing,
                  OVWindowController,
                  Window,
                  PLManager {
    Journal journal;
    bool has(std::string_view entry) const
    {
        return std::find(journal.begin(), journal.end(), entry) != journal.end();
    }
    long count(std::string_view entry) const
    {
        return std::count(journal.begin(), journal.end(), entry);
    }

    // The controls of the interface file.
    FakeTextField instructions;
    FakeTextView messageText;
    std::map<std::string, FakeButton, std::less<>> buttons;
    FakeOutlinePeer outlinePeer;
    std::unique_ptr<OutlineView> outlineView;
    InterfaceOwner* owner = nullptr;
    bool hasInterfaceFile = true;

    // HostServices and ModuleSite
    OVPreferences& sharedPreferences() override { return *this; }
    OVDiskController& sharedDiskController() override { return *this; }
    OVLog& log() override { return *this; }
    NotificationCenter& defaultCenter() override { return *this; }
    RunLoop& mainRunLoop() override { return *this; }
    Threads& threads() override { return *this; }
    UserDefaults& standardUserDefaults() override { return *this; }
    Bundle& hostBundle() override { return *this; }
    ImageAttachment& imageAttachment() override { return *this; }
    Alerts& alerts() override { return *this; }
    Events& events() override { return *this; }
    HelpManager& sharedHelpManager() override { return *this; }
    InterfaceLoader& interfaceLoader() override { return *this; }
    Pasteboard& generalPasteboard() override { return *this; }
    Printing& printing() override { return *this; }
    std::unique_ptr<OVTimeEstimator> makeTimeEstimator() override
    {
        return std::make_unique<FakeEstimator>(estimate, journal);
    }
    std::string OVLocalizedErrorString(ErrorCode code) override
    {
        return "error " + std::to_string(code);
    }
    std::string decimalString(const Value& number) override;
    bool isActiveTab() const override { return isActive; }
    OVWindowController& windowController() override { return *this; }
    OVDiskPointer workingDisk() const override { return working; }
    Window& window() override { return *this; }
    Bundle& bundle() override { return *this; }
    PLManager& pl() override { return *this; }
    bool isActive = true;
    OVDiskPointer working;
    std::string estimate;

    // OVPreferences
    bool showDetailsInFixwell() const override { return showsDetails; }
    void setShowDetailsInFixwell(bool shows) override { showsDetails = shows; }
    bool rootVolumeIsReadOnly() const override { return rootIsReadOnly; }
    bool showsDetails = false;
    bool rootIsReadOnly = false;

    // OVDiskController
    OVDiskPointer diskWithIdentifier(std::string_view identifier) override;
    OVDiskPointer diskWithKRDisk(const DiskReferencePointer& disk) override
    {
        return disk ? diskWithIdentifier(disk->identifier) : nullptr;
    }
    OVDiskPointer findOrCreateOVDisk(const DiskReferencePointer& disk) override
    {
        return diskWithKRDisk(disk);
    }
    std::vector<OVDiskPointer> viewablePartitions(const OVDiskPointer& disk) override
    {
        return disk ? disk->children() : std::vector<OVDiskPointer>();
    }
    void mountDisk(const OVDiskPointer& disk, bool includeChildren, bool synchronous) override;
    void ejectDisk(const OVDiskPointer& disk, bool synchronous) override;
    void notifyFrontmostModulesOnly(Name name, const Notification& notification) override;
    std::vector<OVDiskPointer> disks;

    // OVLog
    bool keepsLevel(int) const override { return true; }
    void ov_log(int level, int /*flags*/, std::string_view line) override
    {
        developerLog.push_back(std::to_string(level) + " " + std::string(line));
    }
    void log(std::string_view text) override { activity.emplace_back(text); }
    void logPriorityWithEOL(std::string_view text, int, bool) override
    {
        activity.emplace_back(text);
    }
    std::vector<std::string> developerLog;
    std::vector<std::string> activity;

    // NotificationCenter
    struct Registration {
        const void* observer;
        Name name;
        Handler handler;
    };
    void addObserver(const void* observer, Name name, Handler handler) override
    {
        registrations.push_back({observer, name, std::move(handler)});
    }
    void removeObserver(const void* observer, Name name) override
    {
        std::erase_if(registrations, [&](const Registration& registration) {
            return registration.observer == observer && registration.name == name;
        });
    }
    void post(const Notification& notification) override;
    std::vector<Registration> registrations;

    // RunLoop: tasks and timers wait for the test.
    bool isMainThread() const override { return true; }
    void performOnMainThread(Task task, Wait wait) override
    {
        if (wait == Wait::UntilDone)
            task();
        else
            tasks.push_back(std::move(task));
    }
    void scheduleTimer(std::chrono::duration<double> delay, Task task) override;
    void runTasks();
    std::vector<Task> tasks;
    std::vector<Task> timers;

    // Threads: a "worker" runs when the test says so.
    void detachNewThread(Task task) override { workers.push_back(std::move(task)); }
    void sleepUntil(Date date) override;
    Date now() const override { return clock; }
    std::vector<Task> workers;
    Date clock{std::chrono::seconds(1'000'000)};

    // UserDefaults
    Value objectForKey(std::string_view key) const override
    {
        const auto found = defaults.find(key);
        return found == defaults.end() ? Value() : found->second;
    }
    void setObjectForKey(const Value& value, std::string_view key) override
    {
        defaults[std::string(key)] = value;
    }
    std::map<std::string, Value, std::less<>> defaults;

    // Bundle
    std::string localizedString(std::string_view key, std::string_view fallback,
                                std::string_view table) const override;
    std::uint64_t stringRevision() const override { return revision; }
    std::filesystem::path pathForResource(std::string_view) const override { return {}; }
    std::map<std::string, std::string, std::less<>> translations;  ///< by "table/key"
    std::uint64_t revision = 1;

    // ImageAttachment
    ErrorCode AttachImageWithURL(const std::filesystem::path& image, Dictionary& result) override;
    OVDiskPointer TopLevelPLDiskForImageDict(const Dictionary& result) override
    {
        return images.at(std::string(result.string(Name("path"))));
    }
    std::map<std::string, OVDiskPointer, std::less<>> images;  ///< by path; others fail

    // Alerts, Events, HelpManager
    std::shared_ptr<Alert> makeAlert(const Alert::Text& text) override
    {
        sheet = std::make_shared<FakeAlert>();
        sheet->text = text;
        return sheet;
    }
    void simpleModuleAlert(const std::string& title, const std::string& message,
                           std::int32_t error) override;
    std::uint64_t currentModifierFlags() const override { return modifiers; }
    void openHelpAnchor(std::string_view anchor) override
    {
        journal.push_back("help " + std::string(anchor));
    }
    std::shared_ptr<FakeAlert> sheet;
    std::uint64_t modifiers = 0;

    // InterfaceLoader
    bool loadInterface(std::string_view name, InterfaceOwner& interfaceOwner) override;
    void disconnect(InterfaceOwner&) override { owner = nullptr; }

    // Pasteboard
    void declareTypes(const std::vector<PasteboardType>& types, const void*) override
    {
        declared = types;
        pasted.clear();
    }
    void setData(std::string_view data, PasteboardType type) override { pasted[type] = data; }
    std::vector<PasteboardType> declared;
    std::map<PasteboardType, std::string> pasted;

    // Printing
    PrintInfo& sharedPrintInfo() override { return printInfo; }
    void runPrintOperation(OutlineView&, const PrintInfo&, bool, Window*) override {}
    PrintInfo printInfo;

    // OVWindowController and Window
    std::vector<OVDiskPointer> allSelectedItemsFilterDuplicates(bool, bool) override
    {
        return selection;
    }
    void setInterfaceLock() override
    {
        journal.emplace_back("lock");
        isLocked = true;
    }
    void resetInterfaceLock() override
    {
        journal.emplace_back("unlock");
        isLocked = false;
    }
    bool interfaceLock() const override { return isLocked; }
    void activateGlobalProgressBar(bool) override {}
    void activateGlobalProgressText(bool) override {}
    void setGlobalProgressBarIndeterminate(bool isNow) override { isIndeterminate = isNow; }
    void startGlobalProgressBarAnimation(const void*) override {}
    void setGlobalProgressBarValue(double percent) override { progress = percent; }
    void setGlobalProgressText(std::string_view text) override { status = text; }
    void notifyWindowOfCompletion(const Dictionary& completion) override
    {
        journal.emplace_back("report");
        report = completion;
    }
    bool isMainWindow() const override { return isMain; }
    std::vector<OVDiskPointer> selection;
    bool isLocked = false;
    bool isMain = true;
    bool isIndeterminate = false;
    double progress = 0;
    std::string status;
    Dictionary report;

    // PLManager
    void setDelegate(PLAsyncDelegate*) override {}
    std::unique_ptr<PLRepairDisk> makeRepairDisk() override
    {
        return std::make_unique<FakeRepairDisk>(*this);
    }
    std::map<std::string, ErrorCode, std::less<>> refusals;  ///< by disk identifier
    std::function<void()> whenBegun;                         ///< while a job is being begun
    bool canTreatPartitionMap = true;
    bool canTreatFilesystem = true;
};

}  // namespace fixwell::testing
