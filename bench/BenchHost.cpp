// SPDX-License-Identifier: Apache-2.0
#include "bench/BenchHost.h"

#include "orvane/support/disks/DiskFacts.h"
#include "orvane/support/modules/ModuleSearch.h"

#include <stdexcept>

namespace orvane::bench {
namespace {

class EndlessJob final : public contract::PLRepairDisk {
    using Reference = contract::DiskReferencePointer;
    using Code = contract::ErrorCode;

    Code beginStoragesystemFilesystemVerifyForDisk(const Reference&) override { return 0; }
    Code beginStoragesystemFilesystemRepairForDisk(const Reference&) override { return 0; }
    Code beginPermissionsVerifyForDisk(const Reference&) override { return 0; }
    Code beginPermissionsRepairForDisk(const Reference&) override { return 0; }
    Code beginPartitionMapVerifyForDisk(const Reference&) override { return 0; }
    Code beginPartitionMapRepairForDisk(const Reference&) override { return 0; }
    bool canRepairPartitionMapForDisk(const Reference&, Code*) override { return false; }
    bool canRepairStoragesystemFilesystemForDisk(const Reference&, Code*) override { return true; }
    bool canVerifyStoragesystemFilesystemForDisk(const Reference&, Code*) override { return true; }
    void cancelCurrentOperation() override {}
};

SupportOptions optionsIn(const std::filesystem::path& state)
{
    SupportOptions options;
    options.paths = {state / "config", state / "state", state / "cache", state / "data"};
    options.capabilities = [](std::string_view) {
        return FilesystemCapabilities{true, true, false};
    };
    return options;
}

DiskTree sampleDisk()
{
    DiskTree tree;
    tree.facts.identifier = "/somewhere/on/this/machine/sample.img#0";
    tree.facts.name = "sample";
    tree.facts.type = diskType::bareVolume;
    tree.facts.filesystem = "ext4";
    tree.facts.path = "/somewhere/on/this/machine/sample.img";
    tree.facts.storage = contract::DiskReference::Storage::FileRegion;
    tree.facts.length = 1U << 30U;
    return tree;
}

}  // namespace

BenchHost::BenchHost(const std::filesystem::path& state)
    : logView_(
          loop_, [](const auto&, const auto&) {}, [] {}, [] {}),
      interface_(logView_),
      alerts_(loop_, reporter_, texts_, TerminalAlerts::Answer::Confirm),
      bundle_(runningExecutable().parent_path().parent_path() / "modules" / "Fixwell.ovmodule",
              "FXW"),
      host_(optionsIn(state), loop_, interface_, alerts_, reporter_, false),
      disk_(Disk::make(sampleDisk(), {optionsIn(state).capabilities, &host_.histories()})),
      module_(std::make_unique<fixwell::OVFXW>(host_, *this))
{
    host_.sharedDiskController().adopt(disk_);
    reference_ = disk_->theKRDisk();
    if (!module_->init())
        throw std::runtime_error("the module could not be made");
}

BenchHost::~BenchHost()
{
    module_.reset();
}

void BenchHost::selectDisk()
{
    window_.select({disk_});
    module_->windowChangedNotication({contract::OVDiskChangedNotification, nullptr, {}});
}

void BenchHost::showDetails(bool shows)
{
    if (module_->outlineViewShouldExpandItem({}) != shows)
        module_->showDetailsAction(nullptr);
}

std::unique_ptr<contract::PLRepairDisk> BenchHost::makeRepairDisk()
{
    return std::make_unique<EndlessJob>();
}

}  // namespace orvane::bench
