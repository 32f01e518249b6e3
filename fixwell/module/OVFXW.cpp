// SPDX-License-Identifier: Apache-2.0
#include "fixwell/module/OVFXW.h"

#include "contract/toolkit/ControlNames.h"
#include "fixwell/messagelog/OVFXWMessageOutlineView.h"

#include <algorithm>
#include <array>

namespace fixwell {
namespace {

constexpr std::string_view interfaceName = "FXW";
constexpr std::size_t bufferCapacity = 1000;
constexpr double indentationPerLevel = 35.0;  // points
constexpr double dividerMinimum = 80.0;       // points
constexpr double dividerMaximum = 210.0;

}  // namespace

bool OVFXW::shouldRunOnThisConfig(HostServices& host, Bundle& bundle)
{
    const Value stored = host.standardUserDefaults().objectForKey("OVModule_FXW");
    const bool isOn = stored.isNone() || stored.boolean();
    host.log().ov_log(
        OVLog::error, 0,
        format("module: %@ - %sloaded\n", {displayNameIn(bundle), isOn ? "" : "not "}));
    return isOn;
}

std::string OVFXW::displayNameIn(const Bundle& bundle)
{
    return bundle.localizedString(localizable("Fixwell"));
}

OVFXW::OVFXW(HostServices& host, ModuleSite& site)
    : OVModule(host, site), lineClassifier_(site.bundle())
{
    outlets_ = {{outlet::instructionalText, &instructionalTextField},
                {outlet::repairMessageText, &repairMessageTextView},
                {outlet::verifyDisk, &verifyDiskButton},
                {outlet::repairDisk, &repairDiskButton},
                {outlet::verifyPermissions, &verifyPermissionsButton},
                {outlet::repairPermissions, &repairPermissionsButton},
                {outlet::showDetails, &showDetailsButton},
                {outlet::clearHistory, &clearHistoryButton},
                {outlet::messageOutline, &messageOutlineView}};
}

OVFXW::~OVFXW()
{
    if (messageOutlineView != nullptr)
        messageOutlineView->setDataSource(nullptr);
    statusViewLock.reset();
    clearActionList();
    // A running job is cancelled here and calls back no more.
    repairDiskTool_.reset();
    if (liveness_)
        *liveness_ = nullptr;
    for (const Name name : {OVDiskAppearedNotification, OVDiskUnmountedNotification,
                            OVDiskChangedNotification, OVDiskEjectedNotification})
        host().defaultCenter().removeObserver(this, name);
    host().interfaceLoader().disconnect(*this);
}

bool OVFXW::init()
{
    if (!OVModule::init())
        return false;
    liveness_ = std::make_shared<OVFXW*>(this);
    host().interfaceLoader().loadInterface(interfaceName, *this);
    statusViewLock = std::make_unique<Lock>();
    _bufferText.reserve(bufferCapacity);
    return true;
}

void OVFXW::awakeFromNib()
{
    for (Button* button :
         {verifyDiskButton, repairDiskButton, verifyPermissionsButton, repairPermissionsButton})
        if (button != nullptr)
            button->setEnabled(false);
    showDetails = host().sharedPreferences().showDetailsInFixwell();
    if (showDetailsButton != nullptr)
        showDetailsButton->setIntegerValue(showDetails ? 1 : 0);
    rootFilesystemIsReadOnly = host().sharedPreferences().rootVolumeIsReadOnly();

    const StyledText text = StyledText::make(
        localized(localizable("If Repair Disk is unavailable, click Verify Disk. If the disk needs "
                              "repairs, you'll be able to repair it from the Kelvra.")),
        instructionalTextParagraphStyle());
    text.append(StyledText::make(
        localized(localizable("\n\nIf you have a permissions problem with a file installed by the "
                              "Zenix installer, click Repair Disk Permissions.")),
        instructionalTextParagraphStyleNoIndent()));
    if (instructionalTextField != nullptr)
        instructionalTextField->setAttributedStringValue(text);

    if (messageOutlineView == nullptr)
        return;
    auto cell = std::make_unique<OVFXWBrowserCell>();
    cell->setWraps(false);
    messageOutlineView->setDataCell(std::move(cell));
    messageOutlineView->setIndentationPerLevel(indentationPerLevel);
    messageOutlineView->setDraggingSourceOperationMask(DragOperation::Every, true);
    messageOutlineView->setDraggingSourceOperationMask(DragOperation::Every, false);
    vScroller = messageOutlineView->verticalScroller();
}

void OVFXW::registerForNotifications()
{
    OVModule::registerForNotifications();
    for (const Name name : {OVDiskAppearedNotification, OVDiskUnmountedNotification,
                            OVDiskChangedNotification, OVDiskEjectedNotification})
        observeDiskNotification(name);
}

void OVFXW::observeDiskNotification(Name name)
{
    host().defaultCenter().addObserver(
        this, name, [this](const Notification& notification) { selectionDidChange(notification); });
}

std::string OVFXW::displayName() const
{
    return displayNameIn(bundle());
}

Value OVFXW::tabOrder() const
{
    return 20;
}

std::string OVFXW::dataType() const
{
    return std::string(interfaceName);
}

void OVFXW::helpButtonAction(const void* /*sender*/)
{
    host().sharedHelpManager().openHelpAnchor("ovhelp11868");
}

double OVFXW::splitViewConstrainMinCoordinateOfSubviewAt(double /*proposed*/, int /*subview*/)
{
    return dividerMinimum;
}

double OVFXW::splitViewConstrainMaxCoordinateOfSubviewAt(double /*proposed*/, int /*subview*/)
{
    return dividerMaximum;
}

PLRepairDisk& OVFXW::repairDiskTool()
{
    if (!repairDiskTool_)
        repairDiskTool_ = pl().makeRepairDisk();
    return *repairDiskTool_;
}

namespace {

struct ActionMethod {
    Selector selector;
    void (OVFXW::*method)(const void* sender);
};

constexpr std::array<ActionMethod, 9> actionMethods{{
    {selector::verifyDisk, &OVFXW::verifyDisk},
    {selector::repairDisk, &OVFXW::repairDisk},
    {selector::verifyPermissions, &OVFXW::verifyPermissions},
    {selector::repairPermissions, &OVFXW::repairPermissions},
    {selector::stop, &OVFXW::stopAction},
    {selector::showDetails, &OVFXW::showDetailsAction},
    {selector::clearHistory, &OVFXW::clearHistoryAction},
    {selector::help, &OVFXW::helpButtonAction},
    {selector::deleteSelected, &OVFXW::deleteSelected},
}};

}  // namespace

bool OVFXW::perform(Selector selector, const void* sender)
{
    const auto found = std::find_if(
        actionMethods.begin(), actionMethods.end(),
        [selector](const ActionMethod& candidate) { return candidate.selector == selector; });
    if (found == actionMethods.end())
        return false;
    (this->*found->method)(sender);
    return true;
}

std::unique_ptr<OutlineView> OVFXW::makeOutlineView(std::string_view className,
                                                    OutlineViewPeer& peer)
{
    if (className != messageOutlineViewClass)
        return nullptr;
    return std::make_unique<OVFXWMessageOutlineView>(peer, host().generalPasteboard());
}

}  // namespace fixwell
