// SPDX-License-Identifier: Apache-2.0
#include "orvane/terminal/Session.h"

#include "orvane/jobs/HostReasons.h"
#include "orvane/privileges/LibraryOptions.h"
#include "orvane/support/DiskLookup.h"
#include "orvane/support/modules/ModuleSearch.h"
#include "orvane/support/settings/XDGPaths.h"
#include "pellar/texts/ErrorTexts.h"

#include <unistd.h>

#include <array>
#include <future>

namespace orvane {
namespace {

TerminalAlerts::Answer answerFor(const Request& request)
{
    if (request.confirms)
        return TerminalAlerts::Answer::Confirm;
    const bool canAsk =
        !request.isJSON && ::isatty(STDIN_FILENO) == 1 && ::isatty(STDOUT_FILENO) == 1;
    return canAsk ? TerminalAlerts::Answer::Ask : TerminalAlerts::Answer::Decline;
}

}  // namespace

Session::Session(const Request& request, Reporter& reporter)
    : reporter_(reporter),
      tracesCommands_(request.tracesCommands),
      logView_(
          loop_,
          [this](const contract::Dictionary& record, const contract::StyledText& text) {
              reporter_.record(jobs_.currentDisk(), record, text);
          },
          [this] { host_.histories().saveNew(); }, [this] { reporter_.rowsWritten(); }),
      interface_(logView_),
      alerts_(loop_, reporter, answerFor(request)),
      hostTexts_(hostBundleDirectory(runningExecutable()) / "locale"),
      libraryTexts_(hostTexts_),
      library_(loop_, libraryTexts_, libraryOptions(request)),
      host_(supportOptions(request), loop_, interface_, alerts_, reporter, request.showsDetails),
      jobs_(reporter, window_, names_, host_, jobHooks()),
      observedLibrary_(library_, jobs_)
{
    window_.setEvents({
        [this] {
            if (jobs_.isInFlight())
                reporter_.progress(jobs_.currentDisk(), window_.percent(), window_.status());
        },
        [this](const contract::Dictionary& report) {
            jobs_.flush();
            reporter_.report(names_.nameOf(report.string(contract::Name("kOVOP_DiskIdentifierKey"))),
                             report);
        },
    });
}

Session::~Session()
{
    // The module goes before what it was given, its running job with it.
    module_.reset();
    host_.histories().saveNew();
}

SupportOptions Session::supportOptions(const Request& request)
{
    SupportOptions options;
    options.hostBundle = hostBundleDirectory(runningExecutable());
    options.keptLogLevel = std::max(request.logLevel, contract::OVLog::error);
    options.shownLogLevel = request.logLevel;
    options.capabilities = [this](std::string_view type) {
        return FilesystemCapabilities{library_.canVerify(type), library_.canRepair(type),
                                      library_.canVerifyLive(type)};
    };
    options.errorText = [this](contract::ErrorCode code) {
        return jobs_.runs().withDevice(code, pellar::errorText(code, libraryTexts_));
    };
    options.warn = [this](const std::string& sentence) {
        reporter_.warning(sentence);
    };
    return options;
}

pellar::JobOptions Session::libraryOptions(const Request& request)
{
    pellar::JobOptions options =
        orvane::libraryOptions(userXDGPaths(), libraryTexts_, asking(),
                               [this](const std::string& sentence) { trace(sentence); });
    options.archiveFetching = {[fetches = request.fetchesArchives] { return fetches; },
                               libraryTexts_.text("With --fetch-archives the archives of these "
                                                  "packages are fetched over the network.")};
    if (tracesCommands_)
        options.commandTrace = [this](std::string_view line) {
            trace(line);
        };
    return options;
}

void Session::trace(std::string_view line)
{
    if (tracesCommands_)
        reporter_.warning(std::string(line));
}

// The job's thread waits until nothing is drawn any more, but not for long: the main thread may be
// waiting for it.
Asking Session::asking()
{
    static constexpr std::chrono::seconds longestWait{3};
    const auto begins = [this] {
        const auto isReady = std::make_shared<std::promise<void>>();
        loop_.post([this, isReady] {
            expectPassword();
            isReady->set_value();
        });
        isReady->get_future().wait_for(longestWait);
    };
    return {begins, [this] {
                loop_.post([this] { asked(); });
            }};
}

void Session::expectPassword()
{
    logView_.flush();
    reporter_.prompt(Reporter::Prompt::Open);
    if (::geteuid() != 0 && (!agent_ || !agent_->isRunning()))
        agent_ = PasswordAgent::start();
}

JobReporter::Hooks Session::jobHooks()
{
    JobReporter::Hooks hooks;
    hooks.flushRows = [this] {
        logView_.flush();
    };
    hooks.follow = [this](const contract::DiskReferencePointer& disk) {
        follow(disk);
    };
    return hooks;
}

Result<void, Failure> Session::loadModule()
{
    const auto bundles = findModuleBundles(
        moduleDirectories(environmentValue, runningExecutable(),
                          [this](const std::string& sentence) { trace(sentence); }));
    if (bundles.empty())
        return cannot("find", "Fixwell.ovmodule", "no module directory holds it");
    auto loaded = orvane::loadModule(bundles.front());
    if (!loaded)
        return loaded.error();
    loaded_ = *std::move(loaded);
    libraryTexts_.setResultTexts(loaded_.bundle->catalogue());
    if (!shouldRun(loaded_, host_))
        return cannot("use", "Fixwell", "it is switched off in the settings (OVModule_FXW)");
    auto made = makeModule(loaded_, host_, *this);
    if (!made)
        return made.error();
    module_ = *std::move(made);
    observedLibrary_.setDelegate(module_->asyncDelegate());
    return {};
}

Result<Session::DiskPointer, Failure> Session::findDisk(const std::string& name)
{
    // Only what is no file needs the system's disks: a mount point, a label, a UUID.
    std::error_code error;
    if (!knowsSystemDisks_ && !std::filesystem::is_regular_file(name, error)) {
        host_.refreshDisks();
        knowsSystemDisks_ = true;
    }
    auto found = DiskLookup(host_.sharedDiskController(), host_.translator()).find(name);
    if (found)
        names_.add((*found)->facts().identifier, name);
    return found;
}

Session::DiskPointer Session::attach(const DiskPointer& image)
{
    if (!image->isOfflineDiskImage())
        return nullptr;
    contract::Dictionary result;
    if (host_.imageAttachment().AttachImageWithURL(image->diskImagePath(), result) != 0)
        return nullptr;
    const auto top =
        std::dynamic_pointer_cast<Disk>(host_.imageAttachment().TopLevelPLDiskForImageDict(result));
    if (top)
        host_.sharedDiskController().adopt(top);
    return top;
}

void Session::detach(const DiskPointer& topLevelDisk)
{
    if (topLevelDisk)
        host_.sharedDiskController().ejectDisk(topLevelDisk, true);
}

std::string Session::reasonOfHost(const Disk& disk)
{
    return orvane::reasonOfHost(disk, library_, host_.translator());
}

std::string Session::reasonAgainstPartitionMap(const DiskPointer& disk) const
{
    return library_.reasonAgainstPartitionMap(*disk->theKRDisk());
}

void Session::select(const std::vector<DiskPointer>& disks)
{
    logView_.holdBack();
    window_.select({disks.begin(), disks.end()});
    module_->windowChangedNotication({contract::OVDiskChangedNotification, nullptr, {}});
}

// The disk list of a window would keep its selection; here the log goes with the disk that is
// being worked on, so that its rows come one after the other.
void Session::follow(const contract::DiskReferencePointer& reference)
{
    if (const auto disk =
            std::dynamic_pointer_cast<Disk>(host_.sharedDiskController().diskWithKRDisk(reference)))
        select({disk});
    logView_.followFromLastRow();
    if (isStopping_)
        loop_.post([this] { pressStop(); });
}

TerminalButton& Session::button(std::string_view outlet)
{
    static TerminalButton missing;
    TerminalButton* const found = interface_.button(outlet);
    return found != nullptr ? *found : missing;
}

void Session::pressAndWait(TerminalButton& button)
{
    // Before, an interruption just ends the program: there is nothing yet to be ended in order.
    const Interrupts interrupts(loop_, [this] { interrupt(); });
    if (!interface_.press(button))
        return;
    loop_.runUntil([this] { return !window_.interfaceLock() && !alerts_.isAsking(); });
    jobs_.flush();
    host_.histories().saveNew();
}

void Session::writeAllRowsOf(const std::string& name)
{
    jobs_.setCurrentDisk(name);
    logView_.writeAllRows();
}

// The first interruption is the Stop button. A job whose images are still being attached has none
// that works; the attaching ends, and should the job begin all the same, it is stopped then. Every
// further interruption presses the tool harder.
void Session::interrupt()
{
    reporter_.prompt(Reporter::Prompt::Left);
    const bool isFirst = !isStopping_;
    isStopping_ = true;
    if (!isFirst)
        observedLibrary_.cancelAgain();
    else if (!pressStop())
        host_.imageAttachment().stopAttachments();
}

bool Session::pressStop()
{
    constexpr std::array outlets{"verifyDiskButton", "repairDiskButton", "verifyPermissionsButton",
                                 "repairPermissionsButton"};
    for (const char* outlet : outlets) {
        TerminalButton& candidate = button(outlet);
        if (!jobs_.currentDisk().empty() && candidate.action() == "stopAction:" &&
            interface_.press(candidate))
            return true;
    }
    return false;
}

}  // namespace orvane
