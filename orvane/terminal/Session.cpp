// SPDX-License-Identifier: Apache-2.0
#include "orvane/terminal/Session.h"

#include "orvane/support/DiskLookup.h"
#include "orvane/support/settings/XDGPaths.h"
#include "orvane/terminal/TerminalText.h"
#include "pellar/texts/ErrorTexts.h"

#include <unistd.h>

#include <future>

namespace orvane {
namespace {

TerminalAlerts::Answer answerFor(const Request& request)
{
    // A timer's check of the startup disk was asked for when the timer was set.
    if (request.confirms || request.command == Command::ScheduledCheck)
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
              reporter_.record(currentDisk_, record, text);
          },
          [this] { host_.histories().saveNew(); }, [this] { reporter_.rowsWritten(); }),
      interface_(logView_),
      alerts_(loop_, reporter, hostTexts_, answerFor(request)),
      hostTexts_(hostBundleDirectory(runningExecutable()) / "locale"),
      libraryTexts_(hostTexts_),
      library_(loop_, libraryTexts_, libraryOptions(request)),
      host_(supportOptions(request), loop_, interface_, alerts_, reporter, request.showsDetails),
      ledger_(host_, {[this](const StartedRun& run, const contract::DiskReferencePointer& disk) {
                          jobBegan(run, disk);
                      },
                      [this](const StartedRun& run, const RunEnd& end) { jobEnded(run, end); },
                      {}})
{
    window_.setEvents(windowEvents());
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
        return ledger_.withDevice(code, pellar::errorText(code, libraryTexts_));
    };
    options.warn = [this](const std::string& sentence) {
        reporter_.warning(sentence);
    };
    return options;
}

pellar::JobOptions Session::libraryOptions(const Request& request)
{
    pellar::JobOptions options = orvane::libraryOptions(
        userXDGPaths(), libraryTexts_, asking(),
        [this](const std::string& sentence) { trace(sentence); }, repairAdvice());
    options.archiveFetching = {[fetches = request.fetchesArchives] { return fetches; },
                               libraryTexts_.text("With --fetch-archives the archives of these "
                                                  "packages are fetched over the network.")};
    options.repairPolicy = [stored = options.repairPolicy(), asked = request.repairPolicy] {
        pellar::RepairPolicy policy = asked;
        policy.isThorough = asked.isThorough || stored.isThorough;
        return policy;
    };
    trials_ = options.trials;
    options.unmounts = request.command != Command::ScheduledCheck;
    options.observer = &ledger_;
    if (tracesCommands_)
        options.commandTrace = [this](std::string_view line) {
            trace(line);
        };
    return options;
}

// Asked on the job's thread. While a job runs no disk gets another name.
RepairAdvice Session::repairAdvice() const
{
    const auto command = [this](std::string_view sentence, std::string_view words,
                                const contract::DiskReference& disk, const std::string& name) {
        const std::string_view option = disk.isWhole ? " --partition-map " : " ";
        return pellar::Sentence{
            sentence, "fixwell " + std::string(words) + std::string(option) + shellWord(name), {}}
            .in(libraryTexts_);
    };
    return {[this, command](const contract::DiskReference& disk) {
                return command("To take the repair back: %1$@", "undo", disk,
                               names_.nameOf(disk.identifier));
            },
            [this, command](const contract::DiskReference& disk) {
                return command("To take the repair back: %1$@", "undo --permissions", disk,
                               names_.nameOf(disk.identifier));
            },
            [this, command](const contract::DiskReference& disk) {
                return command(
                    "To apply it although damage would be left, which can be undone as "
                    "well: %1$@",
                    "repair --apply-unproven", disk, names_.namedOf(disk.identifier));
            },
            [this, command](const contract::DiskReference& disk) {
                return command(
                    "To let the tool write to the disk itself, which cannot be undone: "
                    "%1$@",
                    "repair --direct", disk, names_.namedOf(disk.identifier));
            }};
}

const PublishedChecks& Session::publishedChecks()
{
    if (!publishedChecks_)
        publishedChecks_ = newestOf(readPublishedChecks(systemChecks),
                                    readPublishedChecks(checksDirectory(userXDGPaths())));
    return *publishedChecks_;
}

const std::vector<CheckTimer>& Session::checkTimers()
{
    if (!checkTimers_)
        checkTimers_ = readCheckTimers();
    return *checkTimers_;
}

const RepairRecords& Session::repairRecords()
{
    if (!repairRecords_)
        repairRecords_.emplace(trials_);
    return *repairRecords_;
}

void Session::trace(std::string_view line) const
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

std::vector<std::filesystem::path> Session::moduleDirectories() const
{
    return orvane::moduleDirectories(environmentValue, runningExecutable(),
                                     [this](const std::string& sentence) { trace(sentence); });
}

contract::OVDiskPointer Session::workingDisk() const
{
    return window_.selection().empty() ? nullptr : window_.selection().front();
}

Result<void, Failure> Session::loadModule(std::string_view name)
{
    const auto bundle = findModule(moduleDirectories(), name);
    if (bundle.empty())
        return Failure{texts().sentence("cannot find ‘%@’: no module directory holds it",
                                        {std::string(name) + ".ovmodule"})};
    auto loaded = orvane::loadModule(bundle);
    if (!loaded)
        return loaded.error();
    loaded_ = *std::move(loaded);
    libraryTexts_.setResultTexts(loaded_.bundle->catalogue());
    if (!shouldRun(loaded_, host_))
        return Failure{
            isChecking() ? texts().text("cannot use ‘Fixwell’: it is switched off in the settings "
                                        "(OVModule_FXW)")
                         : texts().sentence("cannot use ‘%@’: it says that it does not run here",
                                            {loaded_.name})};
    auto made = makeModule(loaded_, host_, *this);
    if (!made)
        return made.error();
    module_ = *std::move(made);
    library_.setDelegate(module_->asyncDelegate());
    return {};
}

std::vector<NamedDisk> Session::findDisks(const std::vector<std::string>& names, int& status,
                                          std::string (*meant)(const std::string& name))
{
    std::vector<NamedDisk> disks;
    for (const std::string& name : names) {
        auto found = findDisk(meant != nullptr ? meant(name) : name);
        if (!found) {
            reporter_.failure(name, found.error().message);
            status |= exitUnchecked;
            continue;
        }
        disks.push_back({name, *std::move(found)});
        names_.add(disks.back().disk->facts().identifier, name);
    }
    return disks;
}

Result<Session::DiskPointer, Failure> Session::findDisk(const std::string& name)
{
    // Only what is no file needs the system's disks: a mount point, a label, a UUID.
    std::error_code error;
    if (!knowsSystemDisks_ && !std::filesystem::is_regular_file(name, error)) {
        host_.refreshDisks();
        knowsSystemDisks_ = true;
    }
    return DiskLookup(host_.sharedDiskController(), host_.translator()).find(name);
}

AttachedImage::AttachedImage(Session& session, const std::shared_ptr<Disk>& image)
    : session_(&session)
{
    auto& attachment = session.host().imageAttachment();
    contract::Dictionary result;
    if (!image->isOfflineDiskImage() ||
        attachment.AttachImageWithURL(image->diskImagePath(), result) != 0)
        return;
    top_ = std::dynamic_pointer_cast<Disk>(attachment.TopLevelPLDiskForImageDict(result));
    if (top_)
        session.host().sharedDiskController().adopt(top_);
}

AttachedImage::~AttachedImage()
{
    if (top_)
        session_->host().sharedDiskController().ejectDisk(top_, true);
}

}  // namespace orvane
