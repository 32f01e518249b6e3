// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Format.h"
#include "contract/foundation/RunLoop.h"
#include "contract/support/OVModule.h"
#include "fixwell/Contract.h"
#include "fixwell/availability/ButtonDecision.h"
#include "fixwell/jobs/ActionListEntry.h"
#include "fixwell/messagelog/LineClassifier.h"
#include "fixwell/messagelog/MessageRows.h"

#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <type_traits>
#include <vector>

namespace fixwell {

struct Launch;

/// The module: one tab of the host's window, in which the user verifies and repairs the selected
/// disks. The one object that holds state; what it decides and computes lies in the pure pieces
/// of the folders, and it conducts them.
///
/// Main thread only, everything: the host's calls, the controls' actions, the disk-management
/// library's callbacks. Only attachThread runs elsewhere, and touches nothing of the object.
class OVFXW final : public OVModule,
                    public InterfaceOwner,
                    public OutlineViewDelegate,
                    public SplitViewDelegate,
                    public PLAsyncDelegate {
public:
    using DiskList = std::vector<OVDiskPointer>;

    // The host's contract (module/).

    /// The on/off switch, asked before a module is made: the user-defaults key "OVModule_FXW",
    /// YES where it is not set. Says in the log what was decided.
    static bool shouldRunOnThisConfig(HostServices& host, Bundle& bundle);
    static std::string displayNameIn(const Bundle& bundle);

    OVFXW(HostServices& host, ModuleSite& site);
    ~OVFXW() override;

    [[nodiscard]] bool init() override;
    void awakeFromNib() override;
    void registerForNotifications() override;
    std::string displayName() const override;
    Value tabOrder() const override;
    std::string dataType() const override;
    void helpButtonAction(const void* sender);
    double splitViewConstrainMinCoordinateOfSubviewAt(double proposed, int subview) override;
    double splitViewConstrainMaxCoordinateOfSubviewAt(double proposed, int subview) override;
    /// The one tool through which every job and capability question goes; made on first use.
    PLRepairDisk& repairDiskTool();

    std::span<const Outlet> outlets() override { return outlets_; }
    std::unique_ptr<OutlineView> makeOutlineView(std::string_view className,
                                                 OutlineViewPeer& peer) override;
    bool perform(Selector selector, const void* sender) override;
    OutlineViewDelegate* outlineViewDelegate() override { return this; }
    SplitViewDelegate* splitViewDelegate() override { return this; }
    PLAsyncDelegate* asyncDelegate() override { return this; }

    // The selection (module/).

    void selectionDidChange(const Notification& notification) override;
    void windowChangedNotication(const Notification& notification) override;
    void diskChangedHandler(const Notification* notification) override;
    const std::shared_ptr<const DiskList>& selectionOfDisks() const { return selectionOfDisks_; }
    void setSelectionOfDisks(std::shared_ptr<const DiskList> disks);

    // The queue and its runner (jobs/).

    void verifyDisk(const void* sender);
    void repairDisk(const void* sender);
    void verifyPermissions(const void* sender);
    void repairPermissions(const void* sender);
    void stopAction(const void* sender);
    Array actionList() const { return actionList_; }
    void setActionList(const Array& entries) { actionList_ = entries; }

    // The disk-management library's callbacks (operations/).

    void plAsyncStartedForDisk(const DiskReferencePointer& disk) override;
    void plAsyncMessageForDisk(const DiskReferencePointer& disk, std::string_view string,
                               const Dictionary& dictionary) override;
    void plAsyncProgressForDisk(const DiskReferencePointer& disk, bool barberPole,
                                float percent) override;
    void plAsyncFinishedForDisk(const DiskReferencePointer& disk, ErrorCode mainError,
                                ErrorCode detailError, const Dictionary& dictionary) override;

    // The log (messagelog/).

    std::size_t outlineViewNumberOfChildrenOfItem(const OutlineItem& item) override;
    OutlineItem outlineViewChildOfItem(std::size_t index, const OutlineItem& item) override;
    bool outlineViewIsItemExpandable(const OutlineItem& item) override;
    bool outlineViewShouldExpandItem(const OutlineItem& item) override;
    bool outlineViewShouldSelectItem(const OutlineItem& item) override;
    std::string outlineViewObjectValueForTableColumnByItem(const OutlineItem& item) override;
    void outlineViewWillDisplayCellForTableColumnItem(BrowserCell& cell,
                                                      const OutlineItem& item) override;
    std::string outlineViewToolTipForCell(const OutlineItem& item) override;
    bool outlineViewWriteItemsToPasteboard(const std::vector<OutlineItem>& items,
                                           Pasteboard& pasteboard) override;
    DragOperation draggingSourceOperationMaskForLocal(bool isLocal) override;
    DragOperation outlineViewValidateDrop(const OutlineItem& item, std::ptrdiff_t index) override;
    bool outlineViewAcceptDrop(const OutlineItem& item, std::ptrdiff_t index) override;
    bool outlineViewWillReturnMenu(std::ptrdiff_t row) override;
    void showDetailsAction(const void* sender);
    void deleteSelected(const void* sender) override;
    bool canPrint() override;
    void printModuleSpecific(const void* sender) override;

    // Availability (availability/).

    bool displayPanelForDiskTypeAndDisk(std::int32_t type, const OVDiskPointer& disk) override;
    bool supportsContextMenuForDiskTypeSelectedDisk(std::int32_t type,
                                                    const OVDiskPointer& disk) override;

    // History (history/).

    void clearHistoryAction(const void* sender);

private:
    // FXW_private: everything that is neither an override nor an interface action.

    friend class OVFXWTest;

    // module/
    std::string localized(std::string_view key) const { return bundle().localizedString(key); }
    template <class... Arguments>
    std::string localizedFormat(std::string_view key, const Arguments&... arguments) const;
    template <class... Arguments>
    void ov_log(int level, std::string_view text, const Arguments&... arguments) const;
    void createWorkingList();
    void observeDiskNotification(Name name);
    void takeUpSelection();

    // jobs/
    void startAction(FXWAction requested);
    void buildActionList(FXWAction requested);
    void queueSelection(FXWAction requested);
    void queueDisk(const OVDiskPointer& disk, FXWAction requested);
    void startRunningState(FXWAction requested);
    void addDiskToActionList(const OVDiskPointer& disk, FXWAction requested);
    bool diskNotInActionList(const OVDiskPointer& disk) const;
    bool actionListContainsBootPartition() const;
    void showStartupDiskWarning();
    void clearActionList();
    void processActionList();
    bool launchEntry(const Dictionary& entry);
    OVDiskPointer findDiskOfEntry(const Dictionary& entry) const;
    Dictionary takeFrontEntry();
    void setRunning(bool isRunning);
    void doneWithActivity();
    void setupRunTimer() {}
    void stopRunTimer() {}
    OVDiskPointer searchForInflightDisk() const;
    void createStartupObject(std::string_view text, const OVDiskPointer& disk);
    void addDiskToCompletedList(const Dictionary& entry);
    void simulateActionList();

    // operations/
    ErrorCode doVerifyDisk(const OVDiskPointer& disk);
    ErrorCode doRepairDisk(const OVDiskPointer& disk);
    ErrorCode doVerifyPermissions(const OVDiskPointer& disk);
    ErrorCode doRepairPermissions(const OVDiskPointer& disk);
    ErrorCode doVerifyPartitionMap(const OVDiskPointer& disk);
    ErrorCode doRepairPartitionMap(const OVDiskPointer& disk);
    ErrorCode launchOperation(const Launch& launch, const OVDiskPointer& disk);
    bool noteMountState(const OVDiskPointer& disk);
    ErrorCode reportFailedLaunch(const Launch& launch, const OVDiskPointer& disk, ErrorCode code,
                                 bool wasMounted);
    bool canVerifyPartitionMap(const OVDiskPointer& disk);
    bool canRepairPartitionMap(const OVDiskPointer& disk);
    /// A plain line of a tool's output as the log takes it.
    struct TextLine {
        std::string_view text;
        Value type;  ///< none for a line that says nothing by itself
        std::int64_t level;
        bool addsLineFeed;
    };
    TextLine classifiedLine(std::string_view line);
    void addTextLine(const OVDiskPointer& disk, std::string_view line);
    bool noteFirstProgress(float percent);
    float rescaledForKestron(float percent);
    void showOverallProgress(float percent);
    void noteFailure(const OVDiskPointer& disk, ErrorCode code);
    void noteSuccess();
    void fileInflightItem();
    void setActionMessage();
    void setActionMessageWithPercentComplete(double percent);
    void attachSelectedImages();
    void detachAttachThread(const OVDiskPointer& image);
    static OVDiskPointer attachThread(HostServices& host, const std::string& path);
    void attachFinished(const OVDiskPointer& topLevelDisk);
    void clearDeferredDisks();
    void delayedMountDisk();

    // messagelog/
    FXWLineClass scanForType(std::string_view line) { return lineClassifier_.classOf(line); }
    std::string doParameterSubstitutionForMessageString(const Dictionary& message) const;
    void repairOutputDictionary(const Dictionary& message, std::string_view string,
                                const OVDiskPointer& disk);
    void addMessageRecord(const Dictionary& message, std::string_view string, std::int64_t level,
                          const OVDiskPointer& inflight);
    void appendMessage(std::string_view text, std::optional<Name> type, std::int64_t level);
    bool forcesReloadOfDiskCheck(const Array& history) const;
    StyledText attributedStringForContext(const Dictionary& record,
                                          std::optional<std::string_view> string);
    const Color& errorColor();
    const Color& passColor();
    void appendTitleToMessageText(std::string_view text);
    void appendSuccessTitleToMessageText(std::string_view text);
    void appendWarningToMessageText(std::string_view text);
    void appendWarningTitleToMessageText(std::string_view text);
    void appendErrorToMessageText(std::string_view text);
    void appendErrorTitleToMessageText(std::string_view text);
    void addObjectAndUpdateView(const Array& history, const Dictionary& record, bool forceReload);
    bool reloadIsDue(const Array& history) const;
    void keepNewestLineInSight();
    void clearMessageText();
    void setMessageText(std::string_view text);
    void reloadMessageView();
    const MessageRows& currentRows();

    // availability/
    std::string reasonString(std::int32_t reason, bool multiSelected) const;
    void enableButtons();
    ButtonDecision decideButtons();
    void applyDecision(const ButtonDecision& decision);

    // history/
    Array allFsckHistoryOfSelection() const;
    /// What allFsckHistoryOfSelection puts together, disk by disk: the same lists as long as they
    /// only grow.
    std::vector<Array> historiesOfSelection() const;
    void createDiskSummaryRecord();
    void notifyDiskChanged(const OVDiskPointer& disk);
    void displaySummary();
    void verifyPermissionsSummary();
    void repairPermissionsSummary();
    void verifyDiskSummary() {}
    void repairDiskSummary() {}
    void sendCompletionReport(const void* ignored);
    void postWarnings();
    std::string actionDescription() const;
    void alertDidEnd(Alert& alert, long returnCode);

    // The fields, under their given names; a field that has an operation of its own name besides
    // carries an underscore at its end. Outlets belong to the front end and are null until, or
    // unless, the interface file connects them.

    TextField* instructionalTextField = nullptr;
    TextView* repairMessageTextView = nullptr;
    Button* verifyDiskButton = nullptr;
    Button* repairDiskButton = nullptr;
    Button* verifyPermissionsButton = nullptr;
    Button* repairPermissionsButton = nullptr;
    Button* showDetailsButton = nullptr;
    Button* clearHistoryButton = nullptr;
    OutlineView* messageOutlineView = nullptr;
    Scroller* vScroller = nullptr;
    std::unique_ptr<Lock> statusViewLock;
    std::unique_ptr<PLRepairDisk> repairDiskTool_;
    Array actionList_;    ///< the job's queue
    Array completedList;  ///< entries that this job has finished with
    Dictionary inflightItem;
    std::int64_t totalActionsInJob = 0;
    std::int64_t currentJob = 0;  ///< 1-based number of the entry being worked on
    std::int64_t action = FXWActionNone;
    bool _jobStarted = false;     ///< the running job has reported usable progress
    bool _stoppedByUser = false;  ///< never cleared: after one stop, every later job is remounted
    DiskList _deferredDisks;      ///< top-level disks of the images attached for this job
    std::int64_t _deferredDisksNotYetAttached = 0;
    FXWAction _deferredActionType = FXWActionNone;
    std::shared_ptr<Object> _runTimer;  ///< reserved; never assigned
    std::string _bufferText;            ///< kept with its capacity; not otherwise used
    bool rootFilesystemIsReadOnly = false;
    bool showDetails = false;
    std::int64_t lineCount = 0;
    std::unique_ptr<OVTimeEstimator> _timeEstimator;
    std::optional<Color> errorColor_;
    std::optional<Color> passColor_;
    std::shared_ptr<const DiskList> selectionOfDisks_;
    std::optional<std::vector<Button*>> alertButtons;  ///< while the startup-disk warning is open

    // One reload of the log counts for all instances, and is remembered for the process's life.
    static inline std::optional<Threads::Date> lastReloadDate;
    static inline std::size_t lastReloadCount = 0;

    DiskList imagesToAttach_;  ///< selected, and attached when the job begins
    std::shared_ptr<Alert> startupDiskWarning_;
    LineClassifier lineClassifier_;
    MessageRows rows_;
    std::vector<Outlet> outlets_;
    /// Handed to tasks that may run after the module is gone; they find it empty then.
    std::shared_ptr<OVFXW*> liveness_;
};

template <class... Arguments>
std::string OVFXW::localizedFormat(std::string_view key, const Arguments&... arguments) const
{
    return format(localized(key), {FormatArgument(arguments)...});
}

// Arguments may be functions, so that what only a log line needs is not put together when the
// line is not kept.
template <class... Arguments>
void OVFXW::ov_log(int level, std::string_view text, const Arguments&... arguments) const
{
    if (!host().log().keepsLevel(level))
        return;
    [[maybe_unused]] const auto value = [](const auto& argument) {
        if constexpr (std::is_invocable_v<decltype(argument)>)
            return argument();
        else
            return argument;
    };
    const auto write = [&](const auto&... values) {
        host().log().ov_log(level, 0, format(text, {FormatArgument(values)...}));
    };
    write(value(arguments)...);
}

}  // namespace fixwell
