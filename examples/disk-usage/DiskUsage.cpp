// SPDX-License-Identifier: Apache-2.0
#include "DiskUsage.h"

#include <algorithm>
#include <atomic>
#include <chrono>
#include <utility>

namespace diskusage {
namespace {

using namespace contract;

constexpr Selector measureAction = "measure:";
constexpr Selector stopAction = "stopAction:";  // by which the host's Stop finds the button
constexpr std::chrono::milliseconds progressInterval{200};

/// In the worker: whether to go on, and now and then how far it is.
class Watch {
public:
    Watch(const std::atomic<bool>& isStopped, std::function<void(const ScanProgress&)> tell)
        : isStopped_(isStopped), tell_(std::move(tell))
    {
    }

    bool operator()(const ScanProgress& progress)
    {
        const auto now = std::chrono::steady_clock::now();
        if (now - told_ >= progressInterval) {
            told_ = now;
            tell_(progress);
        }
        return !isStopped_;
    }

private:
    const std::atomic<bool>& isStopped_;
    std::function<void(const ScanProgress&)> tell_;
    std::chrono::steady_clock::time_point told_{};
};

}  // namespace

/// What the worker and the main thread share. The worker may outlive the module.
struct DiskUsage::Run {
    std::atomic<bool> isStopped = false;
    DiskUsage* module = nullptr;  ///< of the main thread; null when it has gone
    Disks disks;                  ///< of the main thread
};

DiskUsage::DiskUsage(HostServices& host, ModuleSite& site)
    : OVModule(host, site),
      text_(host, site.bundle()),
      outlets_{Outlet{"instructions", &instructions_}, Outlet{"usage", &usage_},
               Outlet{"measureButton", &measureButton_}}
{
}

DiskUsage::~DiskUsage()
{
    if (run_) {
        run_->isStopped = true;
        run_->module = nullptr;
    }
    host().interfaceLoader().disconnect(*this);
}

bool DiskUsage::init()
{
    return host().interfaceLoader().loadInterface("DiskUsage", *this);
}

std::string DiskUsage::displayName() const
{
    return text_.localized(localizable("Disk Usage"));
}

bool DiskUsage::perform(Selector action, const void* /*sender*/)
{
    if (action == measureAction)
        measure();
    else if (action == stopAction && run_)
        run_->isStopped = true;
    else
        return false;
    show();
    return true;
}

DiskUsage::Disks DiskUsage::selectedVolumes() const
{
    Disks volumes;
    const auto add = [&volumes](const OVDiskPointer& disk) {
        const auto isSame = [&](const OVDiskPointer& other) {
            return other->isEqual(*disk);
        };
        if (std::ranges::none_of(volumes, isSame))
            volumes.push_back(disk);
    };
    for (const OVDiskPointer& disk :
         windowController().allSelectedItemsFilterDuplicates(false, true)) {
        const Disks parts = diskController().viewablePartitions(disk);
        if (parts.empty() || hasMountPoint(*disk))
            add(disk);
        std::ranges::for_each(parts, add);
    }
    return volumes;
}

// The window is locked, although nothing is written: a volume that is read cannot be unmounted,
// which a check would want to.
void DiskUsage::measure()
{
    Disks disks = selectedVolumes();
    std::erase_if(disks, [](const OVDiskPointer& disk) { return !hasMountPoint(*disk); });
    if (run_ || windowController().interfaceLock() || disks.empty())
        return;
    run_ = std::make_shared<Run>();
    run_->module = this;
    run_->disks = disks;
    windowController().setInterfaceLock();
    windowController().activateGlobalProgressBar(true);
    windowController().activateGlobalProgressText(true);
    windowController().setGlobalProgressBarIndeterminate(true);
    windowController().startGlobalProgressBarAnimation(this);

    std::vector<std::string> places;
    for (const OVDiskPointer& disk : disks)
        places.push_back(*disk->mountPoint());
    RunLoop& loop = host().mainRunLoop();
    host().threads().detachNewThread([&loop, run = run_, places = std::move(places)] {
        const auto tell = [&loop, run](std::function<void(DiskUsage&)> what) {
            loop.performOnMainThread(
                [run, what = std::move(what)] {
                    if (run->module != nullptr)
                        what(*run->module);
                },
                RunLoop::Wait::No);
        };
        for (std::size_t i = 0; i < places.size() && !run->isStopped; ++i) {
            Watch watch(run->isStopped, [&tell, run, i](const ScanProgress& progress) {
                tell([run, i, progress](DiskUsage& module) {
                    module.windowController().setGlobalProgressText(
                        module.text_.ofProgress(*run->disks[i], progress));
                });
            });
            ScanResult result = scanDirectory(places[i], {}, std::ref(watch));
            tell([run, i, result = std::move(result)](DiskUsage& module) {
                module.measured(run->disks[i], result);
            });
        }
        tell([](DiskUsage& module) { module.ended(); });
    });
}

void DiskUsage::measured(const OVDiskPointer& disk, ScanResult result)
{
    measurements_[disk->diskIdentifier()] = {disk->mountPoint().value_or(""), std::move(result)};
    show();
}

void DiskUsage::ended()
{
    run_->module = nullptr;
    run_.reset();
    windowController().setGlobalProgressText("");
    windowController().activateGlobalProgressText(false);
    windowController().activateGlobalProgressBar(false);
    windowController().resetInterfaceLock();
    show();
}

void DiskUsage::show()
{
    const Disks volumes = selectedVolumes();
    if (instructions_ != nullptr)
        instructions_->setAttributedStringValue(StyledText::make(
            text_.localized(volumes.empty()
                                ? localizable("Select disks to see how full they are.")
                                : localizable("Click Measure to see what takes the room. Links "
                                              "are not followed, and nothing is changed.")),
            instructionalTextParagraphStyle()));
    if (usage_ != nullptr)
        usage_->setString(textOf(volumes));
    if (measureButton_ != nullptr)
        showButton(volumes);
}

std::string DiskUsage::textOf(const Disks& volumes) const
{
    std::string text;
    for (const OVDiskPointer& disk : volumes) {
        text += (text.empty() ? "" : "\n") + text_.ofDisk(*disk);
        const auto found = measurements_.find(disk->diskIdentifier());
        if (found != measurements_.end() && found->second.mountPoint == disk->mountPoint())
            text += text_.ofScan(found->second.result);
    }
    return text;
}

void DiskUsage::showButton(const Disks& volumes)
{
    const auto isMounted = [](const OVDiskPointer& disk) {
        return hasMountPoint(*disk);
    };
    std::string_view reason;
    if (run_)
        reason = run_->isStopped ? localizable("It is being stopped.") : "";
    else if (windowController().interfaceLock())
        reason = localizable("Not available while a job runs.");
    else if (volumes.empty())
        reason = localizable("Select a disk first.");
    else if (std::ranges::none_of(volumes, isMounted))
        reason = localizable("Not available because nothing that is selected is mounted.");
    measureButton_->setTitle(
        text_.localized(run_ ? localizable("Stop Measuring") : localizable("Measure")));
    measureButton_->setAction(run_ ? stopAction : measureAction);
    measureButton_->setEnabled(reason.empty());
    measureButton_->setReason(reason.empty() ? std::string() : text_.localized(reason));
}

}  // namespace diskusage
