// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/DesktopSession.h"

#include "orvane/desktop/toolkit/Text.h"
#include "orvane/desktop/window/WindowState.h"
#include "orvane/jobs/HostReasons.h"
#include "orvane/privileges/LibraryOptions.h"
#include "pellar/ErrorTexts.h"

#include <QFile>
#include <QLabel>

#include <algorithm>
#include <array>
#include <cstdio>

namespace orvane::desktop {
namespace {

constexpr std::array<fixwell::Name const*, 4> diskNotifications{
    &fixwell::OVDiskAppearedNotification, &fixwell::OVDiskUnmountedNotification,
    &fixwell::OVDiskChangedNotification, &fixwell::OVDiskEjectedNotification};

std::string joined(const std::vector<std::string>& sentences)
{
    std::string text;
    for (const std::string& sentence : sentences)
        text += (text.empty() ? "" : "\n") + sentence;
    return text;
}

}  // namespace

DesktopSession::DesktopSession(SessionOptions options)
    : options_(std::move(options)),
      hostTexts_(hostBundleDirectory(runningExecutable()) / "locale"),
      libraryTexts_(hostTexts_),
      library_(loop_, libraryTexts_, libraryOptions()),
      host_(supportOptions(), loop_),
      window_(host_.translator()),
      disks_(
          host_.sharedDiskController(), [this](const Disk& disk) { return lastCheckOf(disk); },
          host_.translator()),
      controller_(window_),
      jobs_(host_, ledgerEvents()),
      images_(host_, {[this](const Disk& disk) { window_.disks().select(disk); },
                      [this](const std::vector<std::string>& sentences) {
                          host_.alerts().simpleModuleAlert(text("Not everything could be opened."),
                                                           joined(sentences), 0);
                      }}),
      scan_(loop_, [this](const std::vector<DiskTree>& disks) { disksRead(disks); })
{
    host_.setWindow(&window_);
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
    for (const fixwell::Name* const name : diskNotifications)
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
    options.errorText = [this](fixwell::ErrorCode code) {
        return pellar::errorText(code, libraryTexts_);
    };
    options.historyCompleted = [this] {
        reloadLog();
    };
    options.warn = [this](const std::string& sentence) {
        warn(sentence);
    };
    return options;
}

pellar::ManagerOptions DesktopSession::libraryOptions()
{
    pellar::ManagerOptions options = orvane::libraryOptions(options_.paths, libraryTexts_);
    options.outputLimits = options_.outputLimits;
    options.archiveFetching = {[this] { return fetchesArchives(); },
                               libraryTexts_.text("The archives of these packages are downloaded "
                                                  "when “Download Package Archives” is switched "
                                                  "on in the Edit menu.")};
    return options;
}

std::optional<LastCheck> DesktopSession::lastCheckOf(const Disk& disk)
{
    const auto run = host_.historyStore().lastRun(host_.histories().keyOf(disk.facts()));
    if (!run)
        return std::nullopt;
    const auto started =
        std::chrono::duration_cast<std::chrono::milliseconds>(run->started.time_since_epoch());
    return LastCheck{run->end ? run->end->verdict : "", run->end ? run->end->message : "",
                     QDateTime::fromMSecsSinceEpoch(started.count())};
}

void DesktopSession::observeDisks()
{
    for (const fixwell::Name* const name : diskNotifications)
        host_.defaultCenter().addObserver(
            this, *name, [this](const fixwell::Notification&) { window_.disks().synchronize(); });
    host_.sharedDiskController().hooks().notifyFrontmost =
        [this](fixwell::Name, const fixwell::Notification& notification) {
            if (ModuleTab* const tab = activeTab())
                tab->deliver(notification);
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
    controller_.setEvents({[this](bool isLocked) { lockChanged(isLocked); }, {}});
}

void DesktopSession::loadModules()
{
    for (const std::filesystem::path& bundle : findModuleBundles(options_.moduleDirectories)) {
        auto tab = ModuleTab::load(bundle, {host_, controller_, jobs_, libraryOptions()});
        if (failed(tab))
            warn(failureMessage(tab));
        else if (std::get<std::unique_ptr<ModuleTab>>(tab))
            addTab(std::get<std::unique_ptr<ModuleTab>>(std::move(tab)));
    }
    if (!tabs_.empty())
        return;
    auto* const label = new QLabel(toQt(text("No module is installed that could work on disks.")));
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
}

void DesktopSession::selectionChanged()
{
    for (std::size_t i = 0; i < tabs_.size(); ++i)
        window_.tabs().setTabEnabled(static_cast<int>(i), tabs_[i]->isOffered());
    updateTabs();
    tellWhyNot();
}

// A button that is grey has no words for a disk that the module knows nothing about.
void DesktopSession::tellWhyNot()
{
    ModuleTab* const tab = activeTab();
    EmptyNote* const note =
        tab != nullptr && tab->interface() != nullptr ? tab->interface()->emptyNote() : nullptr;
    if (note == nullptr)
        return;
    const auto disks = window_.disks().selectedDisks();
    note->tell(disks.size() == 1 ? toQt(reasonOfHost(*disks.front(), library_, host_.translator()))
                                 : QString());
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
