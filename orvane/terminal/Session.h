// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/toolkit/ControlNames.h"
#include "orvane/jobs/HostJob.h"
#include "orvane/jobs/JobLedger.h"
#include "orvane/jobs/LibraryTexts.h"
#include "orvane/jobs/PublishedChecks.h"
#include "orvane/jobs/RepairRecords.h"
#include "orvane/privileges/LibraryOptions.h"
#include "orvane/support/modules/ModuleLoader.h"
#include "orvane/support/modules/ModuleSearch.h"
#include "orvane/support/systemd/CheckTimers.h"
#include "orvane/terminal/CommandLine.h"
#include "orvane/terminal/PasswordAgent.h"
#include "orvane/terminal/TerminalHost.h"
#include "pellar/Manager.h"

#include <array>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace orvane {

/// A disk as the user named it.
struct NamedDisk {
    std::string name;
    std::shared_ptr<Disk> disk;
};

/// A command and the module's button that it presses.
struct ActionButton {
    Command command;
    std::string_view outlet;
};

inline constexpr std::array<ActionButton, 4> actionButtons{{
    {Command::Verify, contract::outlet::verifyDisk},
    {Command::Repair, contract::outlet::repairDisk},
    {Command::VerifyPermissions, contract::outlet::verifyPermissions},
    {Command::RepairPermissions, contract::outlet::repairPermissions},
}};

/// One run of the program: the host, the library and the module, what the commands do with them,
/// and what comes of the jobs. Main thread only; one at a time.
///
/// It follows the jobs: tells the reporter, and remembers the verdicts for the exit status.
class Session final : private contract::ModuleSite {
public:
    using DiskPointer = std::shared_ptr<Disk>;

    /// The reporter outlives the session.
    Session(const Request& request, Reporter& reporter);
    Session(const Session&) = delete;
    Session& operator=(const Session&) = delete;
    ~Session() override;

    /// Loads the module of this name; a sentence when that fails. Once.
    [[nodiscard]] Result<void, Failure> loadModule(std::string_view name = checkingModule);

    /// The disks that the user means; their later rows and events go by these names. One that
    /// cannot be found is reported, and adds exitUnchecked to `status`. `meant` is asked what a
    /// name stands for here, if not for itself.
    std::vector<NamedDisk> findDisks(const std::vector<std::string>& names, int& status,
                                     std::string (*meant)(const std::string& name) = nullptr);
    /// A password may be asked for from now on: there is an agent, and nothing is drawn until
    /// `asked`.
    void expectPassword();
    void asked() { reporter_.prompt(Reporter::Prompt::Over); }

    /// What a click on these disks in a list would do.
    void select(const std::vector<DiskPointer>& disks);
    TerminalButton& button(std::string_view outlet) { return interface_.button(outlet); }
    const TerminalInterface& interface() const { return interface_; }
    const contract::OVModule& module() const { return *module_; }
    /// Where modules are looked for.
    std::vector<std::filesystem::path> moduleDirectories() const;
    /// Presses the button, and returns when the job is over or was declined.
    void pressAndWait(TerminalButton& button);
    /// Does what no module knows, and returns when it is over; how it ended.
    RunEnd carryOut(pellar::Task task, const DiskPointer& disk);
    /// Writes the selected disks' whole log, under the name that the user gave.
    void writeAllRowsOf(const std::string& name);

    bool wasDeclined() const { return alerts_.wasDeclined(); }
    bool wasStopped() const { return isStopping_; }
    /// How the jobs ended, by disk identifier.
    const std::map<std::string, RunEnd>& outcomes() const { return outcomes_; }
    TerminalHost& host() { return host_; }
    const Translator& texts() { return host_.translator(); }
    const pellar::Manager& library() const { return library_; }
    /// Read when this is first asked.
    const RepairRecords& repairRecords();
    /// What scheduled checks have found, this user's and the system's; read when this is first
    /// asked.
    const PublishedChecks& publishedChecks();
    /// When scheduled checks are due; asked for when this is first asked, for two seconds at most.
    const std::vector<CheckTimer>& checkTimers();
    const GivenNames& names() const { return names_; }

private:
    bool isActiveTab() const override { return true; }
    contract::OVWindowController& windowController() override { return window_; }
    contract::OVDiskPointer workingDisk() const override;
    contract::Window& window() override { return window_; }
    contract::Bundle& bundle() override { return *loaded_.bundle; }
    contract::PLManager& pl() override { return library_; }

    SupportOptions supportOptions(const Request& request);
    pellar::JobOptions libraryOptions(const Request& request);
    TerminalWindow::Events windowEvents();
    RepairAdvice repairAdvice() const;
    void trace(std::string_view line) const;
    bool isChecking() const { return loaded_.name == checkingModule; }
    Asking asking();
    [[nodiscard]] Result<DiskPointer, Failure> findDisk(const std::string& name);
    void follow(const contract::DiskReferencePointer& disk);
    void jobBegan(const StartedRun& run, const contract::DiskReferencePointer& disk);
    void jobEnded(const StartedRun& run, const RunEnd& end);
    void reportEnd();
    void interrupt();
    bool pressStop();

    Reporter& reporter_;
    const bool tracesCommands_;
    std::unique_ptr<PasswordAgent> agent_;
    MainLoop loop_;
    GivenNames names_;
    TerminalWindow window_;
    LogView logView_;
    TerminalInterface interface_;
    TerminalAlerts alerts_;
    Catalogue hostTexts_;
    LibraryTexts libraryTexts_;
    pellar::Trials trials_;  ///< as the library has them
    std::optional<RepairRecords> repairRecords_;
    std::optional<PublishedChecks> publishedChecks_;
    std::optional<std::vector<CheckTimer>> checkTimers_;
    pellar::Manager library_;
    TerminalHost host_;
    JobLedger ledger_;
    LoadedModule loaded_;
    std::unique_ptr<contract::OVModule> module_;
    std::string currentDisk_;     ///< what the user calls the disk whose rows are coming
    HostJob* hostJob_ = nullptr;  ///< that is under way
    std::optional<RunEnd> unreportedEnd_;
    std::map<std::string, RunEnd> outcomes_;
    bool isStopping_ = false;
    bool knowsSystemDisks_ = false;
};

/// The volumes of an image file, known for as long as this lives, as they are to a job. None of any
/// other disk. The session outlives it.
class AttachedImage {
public:
    AttachedImage(Session& session, const std::shared_ptr<Disk>& image);
    AttachedImage(AttachedImage&&) = default;
    AttachedImage& operator=(AttachedImage&&) = delete;
    ~AttachedImage();

    /// None as well where the image cannot be attached.
    const std::shared_ptr<Disk>& top() const { return top_; }

private:
    Session* session_;
    std::shared_ptr<Disk> top_;
};

}  // namespace orvane
