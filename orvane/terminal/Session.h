// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/jobs/LibraryTexts.h"
#include "orvane/jobs/ObservedManager.h"
#include "orvane/privileges/PrivilegedScript.h"
#include "orvane/support/modules/ModuleLoader.h"
#include "orvane/terminal/CommandLine.h"
#include "orvane/terminal/DiskNames.h"
#include "orvane/terminal/Interrupts.h"
#include "orvane/terminal/JobReporter.h"
#include "orvane/terminal/PasswordAgent.h"
#include "orvane/terminal/TerminalHost.h"
#include "orvane/terminal/TerminalWindow.h"
#include "pellar/Manager.h"

#include <memory>
#include <string>
#include <vector>

namespace orvane {

/// One run of the program: the host, the library and the module, and what the commands do with
/// them. Main thread only; one at a time.
class Session final : private contract::ModuleSite {
public:
    using DiskPointer = std::shared_ptr<Disk>;

    /// The reporter outlives the session.
    Session(const Request& request, Reporter& reporter);
    Session(const Session&) = delete;
    Session& operator=(const Session&) = delete;
    ~Session() override;

    /// Loads the module; a sentence when that fails.
    [[nodiscard]] Result<void, Failure> loadModule();

    /// The disk that the user means; its later rows and events go by that name.
    [[nodiscard]] Result<DiskPointer, Failure> findDisk(const std::string& name);
    /// Makes the volumes of an image file known, as a job would; none for any other disk. To be
    /// given back with `detach`.
    DiskPointer attach(const DiskPointer& image);
    void detach(const DiskPointer& topLevelDisk);
    /// Somebody else may ask for a password from now on: nothing is drawn, and there is an agent
    /// that can, until `asked`.
    void expectPassword();
    void asked() { reporter_.prompt(Reporter::Prompt::Over); }
    /// Why the library cannot treat the disk's partition map; empty when it can.
    std::string reasonAgainstPartitionMap(const DiskPointer& disk) const;
    /// Why the host has nothing to offer for the disk; empty when that is not its to say.
    std::string reasonOfHost(const Disk& disk);

    /// What a click on these disks in a list would do.
    void select(const std::vector<DiskPointer>& disks);
    TerminalButton& button(std::string_view outlet);
    /// Presses the button, and returns when the job is over or was declined.
    void pressAndWait(TerminalButton& button);
    /// Writes the selected disks' whole log, under the name that the user gave.
    void writeAllRowsOf(const std::string& name);

    bool wasDeclined() const { return alerts_.wasDeclined(); }
    bool wasStopped() const { return isStopping_; }
    TerminalHost& host() { return host_; }
    const DiskNames& names() const { return names_; }
    const JobReporter& jobs() const { return jobs_; }

private:
    bool isActiveTab() const override { return true; }
    contract::OVWindowController& windowController() override { return window_; }
    contract::OVDiskPointer workingDisk() const override { return nullptr; }
    contract::Window& window() override { return window_; }
    contract::Bundle& bundle() override { return *loaded_.bundle; }
    contract::PLManager& pl() override { return observedLibrary_; }

    SupportOptions supportOptions(const Request& request);
    pellar::JobOptions libraryOptions(const Request& request);
    void trace(std::string_view line);
    Asking asking();
    JobReporter::Hooks jobHooks();
    void follow(const contract::DiskReferencePointer& disk);
    void interrupt();
    bool pressStop();

    Reporter& reporter_;
    const bool tracesCommands_;
    std::unique_ptr<PasswordAgent> agent_;
    MainLoop loop_;
    DiskNames names_;
    TerminalWindow window_;
    LogView logView_;
    Interface interface_;
    TerminalAlerts alerts_;
    Catalogue hostTexts_;
    LibraryTexts libraryTexts_;
    pellar::Manager library_;
    TerminalHost host_;
    JobReporter jobs_;
    ObservedManager observedLibrary_;
    LoadedModule loaded_;
    std::unique_ptr<contract::OVModule> module_;
    bool isStopping_ = false;
    bool knowsSystemDisks_ = false;
};

}  // namespace orvane
