// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/support/OVModule.h"
#include "fixwell/Contract.h"

#include <algorithm>
#include <functional>
#include <map>
#include <memory>
#include <string>
#include <vector>

namespace fixwell::testing {

/// What the module asked of the host, in order.
using Journal = std::vector<std::string>;

struct FakeFilesystem final : OVFilesystem {
    std::string type = "ext4";
    bool repairs = true;
    bool verifies = true;
    bool verifiesLive = false;

    std::string filesystemType() const override { return type; }
    bool canBeRepaired() const override { return repairs; }
    bool canBeVerified() const override { return verifies; }
    bool supportsLiveVerify() const override { return verifiesLive; }
};

/// A volume with everything in order, until a test says otherwise.
struct FakeDisk final : OVDisk {
    explicit FakeDisk(std::string id) : identifier(std::move(id)), name(identifier)
    {
        auto made = std::make_shared<DiskReference>();
        made->identifier = identifier;
        made->path = "/dev/" + identifier;
        reference = made;
    }

    std::string identifier;
    std::string name;
    std::int32_t type = 3;
    std::int64_t number = 0;
    bool whole = false;
    std::weak_ptr<OVDisk> parent;
    std::vector<OVDiskPointer> volumes;
    std::optional<std::string> mount;
    bool writable = true;
    bool boot = false;
    bool home = false;
    bool smartError = false;
    bool dvdRAM = false;
    bool blankMedia = false;
    bool offlineImage = false;
    std::string imagePath;
    bool ownership = true;
    bool permissionsRepairable = true;
    FakeFilesystem fileSystem;
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
    const OVFilesystem* filesystem() const override { return &fileSystem; }
    DiskReferencePointer theKRDisk() const override { return reference; }
    Array fsckHistory() const override;
    Array fsckHistoryNoChildren() const override { return history; }
    void setFsckHistory(const Array& records) override { history = records; }
    bool clearFsckHistory() override;
};

struct FakeButton final : Button {
    bool enabled = true;
    std::string toolTip;
    std::string reason;
    std::string title;
    std::string action;
    std::string key = "unset";
    std::int64_t value = -1;
    std::int64_t tag = 0;

    void setNeedsDisplay(bool) override {}
    void setEnabled(bool isOn) override { enabled = isOn; }
    bool isEnabled() const override { return enabled; }
    void setToolTip(std::string_view text) override { toolTip = text; }
    void setTitle(std::string_view text) override { title = text; }
    void setAction(Selector selector) override { action = selector; }
    void setIntegerValue(std::int64_t number) override { value = number; }
    void setKeyEquivalent(std::string_view equivalent) override { key = equivalent; }
    void setTag(std::int64_t number) override { tag = number; }
    void setReason(std::string_view text) override { reason = text; }
};

struct FakeTextField final : TextField {
    StyledText text;

    void setNeedsDisplay(bool) override {}
    void setEnabled(bool) override {}
    bool isEnabled() const override { return true; }
    void setToolTip(std::string_view) override {}
    void setAttributedStringValue(const StyledText& value) override { text = value; }
};

struct FakeTextView final : TextView {
    std::string text = "old";

    void setNeedsDisplay(bool) override {}
    void setString(std::string_view value) override { text = value; }
};

struct FakeScroller final : Scroller {
    double position = 1.0;

    double value() const override { return position; }
};

/// A widget without a screen: it counts its rows when it is told to reload, as a real one does.
struct FakeOutlinePeer final : OutlineViewPeer {
    OutlineViewDelegate* delegate = nullptr;
    std::size_t rows = 0;
    int reloads = 0;
    int baseKeys = 0;
    std::vector<std::size_t> selected;
    std::vector<std::size_t> scrolledTo;
    std::vector<Rect> redrawn;
    FakeScroller scroller;
    double indentation = 0;
    bool enabled = true;

    void reloadData() override;
    std::size_t numberOfRows() const override { return rows; }
    std::vector<std::size_t> selectedRowIndexes() const override { return selected; }
    std::size_t numberOfSelectedRows() const override { return selected.size(); }
    void scrollRowToVisible(std::size_t row) override { scrolledTo.push_back(row); }
    Rect rectOfRow(std::size_t row) const override;
    Rect frameOfCellAtColumnRow(std::size_t, std::size_t row) const override;
    Rect frameOfOutlineCellAtRow(std::size_t) const override { return {0, 0, 10, 10}; }
    void keyDown(const KeyEvent&) override { ++baseKeys; }
    void selectAll() override {}
    void setNeedsDisplay(bool) override {}
    void setNeedsDisplayInRect(const Rect& rect) override { redrawn.push_back(rect); }
    void setEnabled(bool isOn) override { enabled = isOn; }
    bool isEnabled() const override { return enabled; }
    void setToolTip(std::string_view) override {}
    void setIndentationPerLevel(double points) override { indentation = points; }
    void setDraggingSourceOperationMask(DragOperation, bool) override {}
    Scroller* verticalScroller() override { return &scroller; }
};

struct FakeAlert final : Alert {
    Text text;
    FakeButton defaultButton;
    FakeButton alternateButton;
    std::function<void(Alert&, long)> end;
    bool isOrderedOut = false;

    std::vector<Button*> buttons() override { return {&defaultButton, &alternateButton}; }
    void beginSheetModalForWindow(Window*, std::function<void(Alert&, long)> then) override
    {
        end = std::move(then);
    }
    void orderOut() override { isOrderedOut = true; }
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
    explicit FakeRepairDisk(struct FakeHost& owner) : host(owner) {}

    ErrorCode beginStoragesystemFilesystemVerifyForDisk(const DiskReferencePointer& disk) override;
    ErrorCode beginStoragesystemFilesystemRepairForDisk(const DiskReferencePointer& disk) override;
    ErrorCode beginPermissionsVerifyForDisk(const DiskReferencePointer& disk) override;
    ErrorCode beginPermissionsRepairForDisk(const DiskReferencePointer& disk) override;
    ErrorCode beginPartitionMapVerifyForDisk(const DiskReferencePointer& disk) override;
    ErrorCode beginPartitionMapRepairForDisk(const DiskReferencePointer& disk) override;
    bool canRepairPartitionMapForDisk(const DiskReferencePointer& disk, ErrorCode* error) override;
    bool canRepairStoragesystemFilesystemForDisk(const DiskReferencePointer&, ErrorCode*) override;
    bool canVerifyStoragesystemFilesystemForDisk(const DiskReferencePointer&, ErrorCode*) override;
    void cancelCurrentOperation() override;

    ErrorCode begin(const char* what, const DiskReferencePointer& disk);

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
    FakeTextField instructionalTextField;
    FakeTextView repairMessageTextView;
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
    OVDiskPointer diskWithKRDisk(const DiskReferencePointer& disk) override;
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
    void ov_log(int level, int flags, std::string_view line) override;
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
    void removeObserver(const void* observer, Name name) override;
    void post(const Notification& notification) override;
    std::vector<Registration> registrations;

    // RunLoop: tasks and timers wait for the test.
    bool isMainThread() const override { return true; }
    void performOnMainThread(Task task, Wait wait) override;
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
    Value objectForKey(std::string_view key) const override;
    void setObjectForKey(const Value& value, std::string_view key) override;
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
    OVDiskPointer TopLevelPLDiskForImageDict(const Dictionary& result) override;
    std::map<std::string, OVDiskPointer, std::less<>> images;  ///< by path; others fail

    // Alerts, Events, HelpManager
    std::shared_ptr<Alert> makeAlert(const Alert::Text& text) override;
    void simpleModuleAlert(const std::string& title, const std::string& message,
                           std::int32_t error) override;
    std::uint64_t currentModifierFlags() const override { return modifiers; }
    void openHelpAnchor(std::string_view anchor) override;
    std::shared_ptr<FakeAlert> sheet;
    std::uint64_t modifiers = 0;

    // InterfaceLoader
    bool loadInterface(std::string_view name, InterfaceOwner& interfaceOwner) override;
    void disconnect(InterfaceOwner&) override { owner = nullptr; }

    // Pasteboard
    void declareTypes(const std::vector<PasteboardType>& types, const void*) override;
    void setData(std::string_view data, PasteboardType type) override { pasted[type] = data; }
    std::vector<PasteboardType> declared;
    std::map<PasteboardType, std::string> pasted;

    // Printing
    PrintInfo& sharedPrintInfo() override { return printInfo; }
    void runPrintOperation(OutlineView&, const PrintInfo& info, bool showsPanel, Window*) override;
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
    void activateGlobalProgressBar(bool isActive) override;
    void activateGlobalProgressText(bool isActive) override;
    void setGlobalProgressBarIndeterminate(bool isIndeterminate) override;
    void startGlobalProgressBarAnimation(const void*) override { journal.emplace_back("animate"); }
    void setGlobalProgressBarValue(double percent) override;
    void setGlobalProgressText(std::string_view text) override { status = text; }
    void notifyWindowOfCompletion(const Dictionary& completion) override;
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
    std::unique_ptr<PLRepairDisk> makeRepairDisk() override;
    std::map<std::string, ErrorCode, std::less<>> refusals;  ///< by disk identifier
    std::function<void()> whenBegun;                         ///< while a job is being begun
    bool canTreatPartitionMap = true;
    bool toolAnswersYes = true;
};

}  // namespace fixwell::testing
