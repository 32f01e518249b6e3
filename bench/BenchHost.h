// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "fixwell/module/OVFXW.h"
#include "orvane/support/texts/Catalogue.h"
#include "orvane/terminal/TerminalHost.h"

#include <filesystem>
#include <memory>

namespace orvane::bench {

/// Says nothing: what is measured ends before a reporter would begin.
class SilentReporter final : public Reporter {
    void started(const std::string&, std::string_view, const std::string&) override {}
    void record(const std::string&, const contract::Dictionary&,
                const contract::StyledText&) override
    {
    }
    void rowsWritten() override {}
    void progress(const std::string&, std::optional<double>, const std::string&) override {}
    void finished(const std::string&, std::string_view, contract::ErrorCode,
                  std::string_view) override
    {
    }
    void alert(const std::string&, const std::string&) override {}
    void failure(const std::string&, const std::string&) override {}
    void warning(const std::string&) override {}
    void listed(const DiskLine&) override {}
    void shown(const ModuleView&) override {}
    void found(const ModuleLine&) override {}
    void done(const std::string&, std::string_view, const std::string&, const std::string&) override
    {
    }
    void runs(const std::string&, const std::vector<RunLine>&) override {}
};

/// The real host of the terminal program with the real module in it, and a library whose one job
/// never ends: a benchmark says what the tool says.
class BenchHost final : public contract::ModuleSite, public contract::PLManager {
public:
    /// Logs and histories go below `state`.
    explicit BenchHost(const std::filesystem::path& state);
    ~BenchHost() override;

    fixwell::OVFXW& module() { return *module_; }
    contract::OutlineViewDelegate& rows() { return *module_; }
    const contract::DiskReferencePointer& reference() const { return reference_; }
    Disk& disk() { return *disk_; }
    TerminalHost& host() { return host_; }
    void selectDisk();
    void showDetails(bool shows);

private:
    bool isActiveTab() const override { return true; }
    contract::OVWindowController& windowController() override { return window_; }
    contract::OVDiskPointer workingDisk() const override { return nullptr; }
    contract::Window& window() override { return window_; }
    contract::Bundle& bundle() override { return bundle_; }
    contract::PLManager& pl() override { return *this; }
    void setDelegate(contract::PLAsyncDelegate*) override {}
    std::unique_ptr<contract::PLRepairDisk> makeRepairDisk() override;

    SilentReporter reporter_;
    MainLoop loop_;
    TerminalWindow window_;
    LogView logView_;
    TerminalInterface interface_;
    Catalogue texts_{std::filesystem::path()};
    TerminalAlerts alerts_;
    ModuleBundle bundle_;
    TerminalHost host_;
    std::shared_ptr<Disk> disk_;
    contract::DiskReferencePointer reference_;
    std::unique_ptr<fixwell::OVFXW> module_;
};

}  // namespace orvane::bench
