// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/DesktopSession.h"

#include "orvane/desktop/toolkit/Text.h"
#include "orvane/desktop/window/WindowState.h"
#include "orvane/privileges/LibraryOptions.h"
#include "pellar/texts/ErrorTexts.h"

#include <QFile>
#include <QLabel>

#include <algorithm>
#include <array>
#include <cstdio>

namespace orvane::desktop {
namespace {

constexpr std::array<contract::Name const*, 4> diskNotifications{
    &contract::OVDiskAppearedNotification, &contract::OVDiskUnmountedNotification,
    &contract::OVDiskChangedNotification, &contract::OVDiskEjectedNotification};

// Of the report that a module gives when its job is over (fixwell/history/CompletionReport.h).
const contract::Name reportResultKey{"kOVOP_ResultKey"};
constexpr std::string_view reportOfFailure = "kOVOP_FailKey";

}  // namespace

std::string DesktopSession::joined(const std::vector<std::string>& sentences)
{
    std::string text;
    for (const std::string& sentence : sentences)
        text += (text.empty() ? "" : "\n") + sentence;
    return text;
}

DesktopSession::DesktopSession(SessionOptions options)
    : options_(std::move(options)),
      hostTexts_(hostBundleDirectory(runningExecutable()) / "locale"),
      libraryTexts_(hostTexts_),
      library_(loop_, libraryTexts_, libraryOptions()),
      host_(supportOptions(), loop_),
      window_(host_.translator()),
      disks_(host_.sharedDiskController(), diskStates(), host_.translator()),
      controller_(window_),
      jobs_(host_, ledgerEvents()),
      images_(host_, {[this](const Disk& disk) { window_.disks().select(disk); },
                      [this](const std::vector<std::string>& sentences) {
                          host_.alerts().simpleModuleAlert(text("Not everything could be opened."),
                                                           joined(sentences), 0);
                      },
                      [this] {
                          window_.disks().synchronize();
                          refreshHints();
                      }}),
      scan_(loop_, [this](const std::vector<DiskTree>& disks) { disksRead(disks); })
{
    host_.setWindow(&window_);
    host_.histories().rememberCleared();
    // Before the modules do: the list must have changed when they ask it for the selection.
    observeDisks();
    loadModules();
    connectWindow();
    restoreWindow(window_, host_.standardUserDefaults());
    updateTabs();
}

DesktopSession::~DesktopSession()
{
    window_.setEvents({});
    host_.generalPasteboard().setHTMLSource({});
    controller_.setEvents({});
    // The modules go before what they were given, their running job with them.
    tabs_.clear();
    for (const contract::Name* const name : diskNotifications)
        host_.defaultCenter().removeObserver(this, *name);
    host_.histories().saveNew();
}

SupportOptions DesktopSession::supportOptions()
{
    SupportOptions options;
    options.paths = options_.paths;
    options.hostBundle = hostBundleDirectory(runningExecutable());
    options.capabilities = [this](std::string_view type) {
        return FilesystemCapabilities{library_.canVerify(type), library_.canRepair(type),
                                      library_.canVerifyLive(type)};
    };
    options.errorText = [this](contract::ErrorCode code) {
        return jobs_.runs().withDevice(code, pellar::errorText(code, libraryTexts_));
    };
    options.historyCompleted = [this] {
        reloadLog();
    };
    options.warn = [this](const std::string& sentence) {
        warn(sentence);
    };
    return options;
}

pellar::JobOptions DesktopSession::libraryOptions()
{
    pellar::JobOptions options = orvane::libraryOptions(options_.paths, libraryTexts_);
    options.outputLimits = options_.outputLimits;
    options.archiveFetching = {[this] { return fetchesArchives(); },
                               libraryTexts_.text("The archives of these packages are downloaded "
                                                  "when “Download Package Archives” is switched "
                                                  "on in the Edit menu.")};
    return options;
}

void DesktopSession::observeDisks()
{
    for (const contract::Name* const name : diskNotifications)
        host_.defaultCenter().addObserver(this, *name, [this](const contract::Notification&) {
            window_.disks().synchronize();
            refreshHints();
        });
    host_.sharedDiskController().hooks().notifyFrontmost =
        [this](contract::Name, const contract::Notification& notification) {
            if (ModuleTab* const tab = activeTab())
                tab->deliver(notification);
            window_.disks().synchronize();
            refreshHints();
            // What the user clears later is another step.
            loop_.post([this] { host_.histories().closeClearing(); });
        };
}

void DesktopSession::connectWindow()
{
    window_.disks().show(disks_, [this] { selectionChanged(); });
    addMenus(window_, menus(), host_.translator());
    window_.setEvents({
        [this] { return mayClose(); },
        [this](const std::vector<std::filesystem::path>& files) {
            images_.open({files.begin(), files.end()});
        },
        [this] { return !controller_.interfaceLock(); },
        [this] { updateTabs(); },
        [this] { windowAppeared(); },
    });
    host_.generalPasteboard().setHTMLSource([this] { return selectionHTML(); });
    host_.printing().setTitle([this] {
        std::string names;
        for (const auto& disk : window_.disks().selectedDisks())
            names += (names.empty() ? "" : ", ") + disk->displayName();
        return names;
    });
    controller_.setEvents({[this](bool isLocked) { lockChanged(isLocked); },
                           [this](const contract::Dictionary& report) {
                               job_.hasFailed = report.string(reportResultKey) == reportOfFailure;
                           }});
    window_.disks().setContextMenuPolicy(Qt::CustomContextMenu);
    QObject::connect(&window_.disks(), &QWidget::customContextMenuRequested, &window_,
                     [this](const QPoint& place) { showDiskMenu(place); });
}

void DesktopSession::loadModules()
{
    std::string switchedOff;
    for (const std::filesystem::path& bundle : findModuleBundles(options_.moduleDirectories)) {
        auto tab = ModuleTab::load(bundle, {host_, controller_, jobs_, libraryOptions()});
        if (!tab)
            warn(tab.error().message);
        else if (*tab)
            addTab(*std::move(tab));
        else
            switchedOff += (switchedOff.empty() ? "" : ", ") + bundle.stem().string();
    }
    if (!tabs_.empty())
        return;
    const std::string why =
        switchedOff.empty()
            ? text("No module is installed that could work on disks.")
            : host_.translator().sentence("%@ is switched off in the settings.", {switchedOff});
    auto* const label = new QLabel(toQt(why));
    label->setTextFormat(Qt::PlainText);
    label->setAlignment(Qt::AlignCenter);
    label->setWordWrap(true);
    window_.tabs().addTab(label, toQtTitle(text("No Modules")));
}

void DesktopSession::addTab(std::unique_ptr<ModuleTab> tab)
{
    const auto order = [](const std::unique_ptr<ModuleTab>& other) {
        return other->module().tabOrder().integer();
    };
    const auto place = std::find_if(tabs_.begin(), tabs_.end(),
                                    [&](const auto& other) { return order(other) > order(tab); });
    QWidget* const page =
        tab->interface() != nullptr ? &tab->interface()->widget() : new QWidget(&window_);
    window_.tabs().insertTab(static_cast<int>(place - tabs_.begin()), page,
                             toQtTitle(tab->module().displayName()));
    if (tab->interface() != nullptr)
        tab->interface()->setBeforeAction(
            [this](std::string_view action) { lastAction_ = action; });
    tabs_.insert(place, std::move(tab));
}

ModuleTab* DesktopSession::activeTab()
{
    const auto current = static_cast<std::size_t>(window_.tabs().currentIndex());
    return current < tabs_.size() ? tabs_[current].get() : nullptr;
}

// Which tab is shown is settled first: a module that hears of the selection asks.
void DesktopSession::updateTabs()
{
    for (const auto& tab : tabs_)
        tab->setActive(tab.get() == activeTab());
    if (ModuleTab* const tab = activeTab())
        tab->tellOfSelection();
    refreshHints();
}

void DesktopSession::selectionChanged()
{
    for (std::size_t i = 0; i < tabs_.size(); ++i)
        window_.tabs().setTabEnabled(static_cast<int>(i), tabs_[i]->isOffered());
    updateTabs();
    for (const auto& disk : window_.disks().selectedDisks())
        images_.refresh(*disk);
}

void DesktopSession::show()
{
    window_.show();
}

void DesktopSession::windowAppeared()
{
    hasAppeared_ = true;
    showWarnings();
    watchSystemDisks();
    openNamed(true);
    if (!options_.scansSystemDisks)
        openNamed(false);
}

void DesktopSession::warn(const std::string& sentence)
{
    std::fprintf(stderr, "orvane: %s\n", sentence.c_str());
    warnings_.push_back(sentence);
    if (hasAppeared_)
        showWarnings();
}

void DesktopSession::showWarnings()
{
    showFailures(std::exchange(warnings_, {}));
}

void DesktopSession::showFailures(const std::vector<std::string>& sentences)
{
    if (!sentences.empty())
        host_.alerts().simpleModuleAlert("", joined(sentences), 0);
}

}  // namespace orvane::desktop
