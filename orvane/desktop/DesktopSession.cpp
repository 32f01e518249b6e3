// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/DesktopSession.h"

#include "orvane/desktop/RunNotes.h"
#include "orvane/support/settings/Switch.h"
#include "pellar/texts/ErrorTexts.h"

#include <cstdio>
#include <utility>

namespace orvane::desktop {
namespace {

constexpr const char* hostTable = "Orvane";

}  // namespace

DesktopSession::DesktopSession(SessionOptions options)
    : options_(std::move(options)),
      hostTexts_(hostBundleDirectory(runningExecutable()) / "locale"),
      libraryTexts_(hostTexts_),
      library_(loop_, libraryTexts_, libraryOptions()),
      host_(supportOptions(), loop_),
      window_(host_.translator()),
      controller_(window_),
      ledger_(host_, ledgerEvents()),
      tabs_(host_, window_, controller_),
      repairs_(libraryOptions().trials),
      disks_(host_, loop_, window_.disks(), ledger_, repairs_, options_.disksToOpen,
             options_.scansSystemDisks,
             {[this] { selectionChanged(); },
              [this] {
                  hints_.refresh();
                  overview_.refresh();
              }}),
      hints_(parts(), library_),
      closer_(parts(), options_.closed),
      jobs_(parts(), disks_, closer_, options_.buses, options_.longestGlanceAway,
            [this] { update(); }),
      undoing_(parts(), disks_, repairs_, libraryTexts_, observedOptions(), [this] { update(); }),
      choices_(parts(), disks_, repairs_, jobPolicy_, [this] { overview_.explainCopying(); }),
      overview_(parts(), disks_, repairs_, choices_, undoing_),
      files_(options_.buses.session,
             {options_.openDirectory,
              [this] {
                  host_.showSheet("",
                                  {host_.translator().text("No file manager could be started.")});
              }}),
      diskCommands_(parts(), disks_, library_, choices_, undoing_, files_, [this] { update(); }),
      dialogs_(parts(), disks_, repairs_, libraryOptions(), [this] { update(); }),
      commands_(parts(), disks_, diskCommands_, dialogs_, [this] { update(); }),
      histories_(options_.paths.state / "history.sqlite3", [this] { takeInHistories(); })
{
    host_.setWindow(&window_);
    host_.histories().rememberCleared();
    // After the list of disks, which must have changed when the modules ask for the selection.
    loadModules();
    connectHost();
    connectWindow();
    window_.restoreLayout(host_.standardUserDefaults());
    update();
}

DesktopSession::~DesktopSession()
{
    window_.setEvents({});
    host_.generalPasteboard().setHTMLSource({});
    host_.generalPasteboard().setTextSource({});
    controller_.setEvents({});
    // The modules go before what they were given, their running job with them.
    tabs_.clear();
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
        return ledger_.withDevice(code, pellar::errorText(code, libraryTexts_));
    };
    options.historyCompleted = [this] {
        tabs_.reloadLog();
    };
    options.warn = [this](const std::string& sentence) {
        warn(sentence);
    };
    return options;
}

pellar::JobOptions DesktopSession::libraryOptions()
{
    pellar::JobOptions options =
        orvane::libraryOptions(options_.paths, libraryTexts_, {}, {}, repairAdvice());
    options.outputLimits = options_.outputLimits;
    options.archiveFetching = {
        [this] { return fetchesPackageArchives.isOn(host_.standardUserDefaults()); },
        libraryTexts_.text("The archives of these packages are downloaded "
                           "when “Download package archives” is switched "
                           "on in the preferences.")};
    options.repairPolicy = [this] {
        pellar::RepairPolicy policy = jobPolicy_;
        policy.isThorough = thoroughVerification.isOn(host_.standardUserDefaults());
        return policy;
    };
    return options;
}

pellar::JobOptions DesktopSession::observedOptions()
{
    pellar::JobOptions options = libraryOptions();
    options.observer = &ledger_;
    return options;
}

RepairAdvice DesktopSession::repairAdvice()
{
    const auto advice = [this](std::string_view key) {
        return [sentence = hostTexts_.translate(hostTable, key)](const contract::DiskReference&) {
            return sentence;
        };
    };
    RepairAdvice all;
    all.undo = advice("To take the repair back, choose Undo Repair in the Disk menu.");
    all.undoPermissions =
        advice("To take the repair back, choose Undo Permissions Repair in the Disk menu.");
    all.apply = advice(
        "“Apply Anyway”, above this log, applies it although it may leave damage. That can "
        "be undone as well.");
    all.repairDirectly = advice(
        "“Repair Directly”, above this log, lets the tool write to the disk itself. That "
        "cannot be undone.");
    return all;
}

JobLedger::Events DesktopSession::ledgerEvents()
{
    return {[this](const StartedRun& run, const contract::DiskReferencePointer& /*disk*/) {
                jobs_.runBegan(run);
            },
            [this](const StartedRun& run, const RunEnd& end) { runEnded(run, end); },
            [this] { jobs_.stopAsked(); },
            [this](const StartedRun& run) {
                jobs_.runProgressed(run);
            }};
}

void DesktopSession::loadModules()
{
    tabs_.load(findModuleBundles(options_.moduleDirectories), observedOptions(),
               [this](const std::string& sentence) { warn(sentence); });
}

void DesktopSession::connectHost()
{
    host_.sharedDiskController().hooks().notifyFrontmost =
        [this](contract::Name, const contract::Notification& notification) {
            if (ModuleTab* const tab = tabs_.active())
                tab->deliver(notification);
            window_.disks().synchronize();
            hints_.refresh();
            overview_.refresh();
            // What the user clears later is another step.
            loop_.post([this] { host_.histories().closeClearing(); });
        };
    // The banner says how a job ended, and what can be done about it.
    host_.alerts().setWithheld([this] { return controller_.interfaceLock() && jobs_.hasResult(); });
    tabs_.setMayPerform([this](std::string_view action) { return choices_.mayPerform(action); });
    host_.generalPasteboard().setHTMLSource([this] { return tabs_.selectedLogHTML(); });
    host_.generalPasteboard().setTextSource([this] { return tabs_.selectedLogText(); });
    host_.printing().setNoteSource(runKnowledge(host_.histories(), host_.translator()).noteOf);
    host_.printing().setTitle([this] {
        std::string names;
        for (const auto& disk : disks_.selected())
            names += (names.empty() ? "" : ", ") + disk->displayName();
        return names;
    });
}

void DesktopSession::connectWindow()
{
    commands_.addMenus();
    commands_.fillBar();
    window_.setEvents({
        [this] { return closer_.mayClose(); },
        [this](const std::vector<std::filesystem::path>& files) {
            disks_.open({files.begin(), files.end()});
        },
        [this] { return !controller_.interfaceLock(); },
        [this] { update(); },
        [this] { windowAppeared(); },
        [this](bool isCompact) { tabs_.setCompact(isCompact); },
    });
    controller_.setEvents({[this](bool isLocked) { lockChanged(isLocked); },
                           [this](const contract::Dictionary& report) { jobs_.reported(report); },
                           [this](std::string_view text) {
                               return jobs_.statusText(text);
                           }});
}

void DesktopSession::lockChanged(bool isLocked)
{
    jobs_.lockChanged(isLocked);
    choices_.lockChanged(isLocked);
    overview_.refresh();
    if (isLocked)
        hints_.refresh();
    else
        loop_.post([this] {
            takeInHistories();
            if (!toOpen_.empty())
                open({});
        });
    if (!isLocked)
        closer_.jobEnded();
}

// What is kept is read before the list shows it.
void DesktopSession::runEnded(const StartedRun& run, const RunEnd& end)
{
    if (run.task.operation != pellar::Operation::Verify)
        repairs_.read();
    jobs_.runEnded(run, end);
    undoing_.runEnded(run, end);
}

void DesktopSession::update()
{
    tabs_.update();
    hints_.refresh();
    overview_.refresh();
    dialogs_.refresh();
}

void DesktopSession::selectionChanged()
{
    tabs_.offer();
    update();
    disks_.refresh(disks_.selected());
}

void DesktopSession::present()
{
    window_.setWindowState(window_.windowState() & ~Qt::WindowMinimized);
    window_.raise();
    window_.activateWindow();
}

// A job has the list for itself.
void DesktopSession::open(const std::vector<std::string>& names)
{
    toOpen_.insert(toOpen_.end(), names.begin(), names.end());
    if (!controller_.interfaceLock() && hasAppeared_)
        disks_.open(std::exchange(toOpen_, {}));
}

// While a job runs, its own records are on their way; the others' are there afterwards.
void DesktopSession::takeInHistories()
{
    if (controller_.interfaceLock() || !host_.historyStore().hasForeignChanges())
        return;
    if (host_.histories().takeInOthers())
        tabs_.reloadLog();
    window_.disks().synchronize();
    update();
}

void DesktopSession::windowAppeared()
{
    hasAppeared_ = true;
    showWarnings();
    disks_.start();
    histories_.start();
    if (!toOpen_.empty())
        open({});
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
    host_.showSheet("", std::exchange(warnings_, {}));
}

}  // namespace orvane::desktop
