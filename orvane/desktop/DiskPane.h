// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/DesktopHost.h"
#include "orvane/desktop/ImageOpener.h"
#include "orvane/desktop/KeptRepairs.h"
#include "orvane/desktop/RecentImages.h"
#include "orvane/desktop/ScheduledChecks.h"
#include "orvane/desktop/window/DiskList.h"
#include "orvane/jobs/JobLedger.h"
#include "orvane/support/disks/DiskWatch.h"
#include "orvane/support/udisks/DiskReader.h"

#include <functional>
#include <memory>
#include <string>
#include <thread>
#include <vector>

namespace orvane::desktop {

/// A run of the history, as the list shows it.
[[nodiscard]] Check checkOf(const Run& run);

/// Reads the system's disks in a thread of its own, because a sleeping drive lets its reader wait
/// for seconds. Main thread.
class DiskScan {
public:
    using Finished = std::function<void(const std::vector<DiskTree>& disks)>;

    /// `finished` is called from the loop, which outlives this object.
    DiskScan(EventLoop& loop, Finished finished) : loop_(loop), finished_(std::move(finished)) {}
    DiskScan(const DiskScan&) = delete;
    DiskScan& operator=(const DiskScan&) = delete;
    /// Waits for a scan that is under way; nothing is heard of it any more.
    ~DiskScan() { *liveness_ = nullptr; }

    /// While a scan is under way, another one follows it: what it has read already may be out of
    /// date. Where the system gives no thread, the scan is done before this returns.
    void start();

private:
    void finish(const std::vector<DiskTree>& disks);

    EventLoop& loop_;
    Finished finished_;
    bool isScanning_ = false;
    bool mustScanAgain_ = false;
    /// Handed to the task that reports back, which finds it empty when this object has gone.
    std::shared_ptr<DiskScan*> liveness_ = std::make_shared<DiskScan*>(this);
    DiskReader reader_;  ///< the thread's, while there is one
    std::jthread thread_;
};

/// The list of disks and what fills it: the system's disks as they come, go and change, also while
/// a job runs, and images; and how the selected ones are mounted, unmounted and ejected. Main
/// thread.
class DiskPane {
public:
    struct Events {
        /// By the user, or by what the end of a job has let go.
        std::function<void()> selectionChanged;
        /// Something else is known of disks.
        std::function<void()> changed;
    };

    /// `named` are opened at the start, as orvane/support/disks/DiskLookup.h takes them. All but
    /// the events and names outlive this object. The list follows the host's disks from here on.
    DiskPane(DesktopHost& host, EventLoop& loop, DiskList& list, const JobLedger& ledger,
             const KeptRepairs& repairs, std::vector<std::string> named, bool scansSystemDisks,
             Events events);
    DiskPane(const DiskPane&) = delete;
    DiskPane& operator=(const DiskPane&) = delete;
    ~DiskPane();

    /// Looks for disks from now on, and opens those that were named.
    void start();
    void open(const std::vector<std::string>& names) { images_.open(names); }
    /// Opens an image that was opened before; where it has gone, that is said, and it is forgotten.
    void openRecent(const std::string& image);
    /// Those that are not open now.
    std::vector<std::string> recentImages() const;
    void forgetRecentImages() { recent_.clear(); }
    void attachAsDevices(const std::vector<std::string>& images);
    /// Takes the images that are selected, or that what is selected lies in, from the list.
    void closeSelectedImages();
    /// Those that were closed last, as far as they are not open again.
    std::vector<std::string> closedImages() const;
    /// Those images, each once.
    std::vector<std::string> selectedImages() const;
    /// Reads everything anew.
    void rescan();
    /// Reads those of the disks anew that are images.
    void refresh(const std::vector<std::shared_ptr<Disk>>& disks);

    std::vector<std::shared_ptr<Disk>> selected() const { return list_.selectedDisks(); }
    /// Selects the disk's row or, of what fills an image, the image's, and no other; NO when it is
    /// in the list no longer.
    bool selectOnly(const Disk& disk);
    DiskList& list() { return list_; }

    /// Why nothing that is selected can be treated so, in the user's language; empty when
    /// something can.
    std::string reasonAgainst(DiskAction action) const;
    void doToSelection(DiskAction action);

    /// Until `release`, the selected disks and the others stay listed, whatever becomes of them.
    void hold(const std::vector<contract::OVDiskPointer>& others);
    void release();

private:
    DiskStates states();
    std::optional<LastCheck> lastCheckOf(const Disk& disk);
    std::optional<QDateTime> nextCheckOf(const Disk& disk);
    std::string activityOn(const Disk& disk);
    std::string noteOn(const Disk& disk);
    void adoptDisks(const std::vector<DiskTree>& disks);
    void openNamed(bool areFiles);
    void tellFailures(const std::vector<std::string>& sentences);
    void synchronize();
    std::vector<DiskRequest> requestsFor(DiskAction action) const;
    void carryOut(std::vector<DiskRequest> requests);

    DesktopHost& host_;
    DiskList& list_;
    const JobLedger& ledger_;
    const KeptRepairs& repairs_;
    const std::vector<std::string> named_;
    const bool scansSystemDisks_;
    const Events events_;
    bool hasReadDisks_ = false;
    ScheduledChecks scheduled_;
    DiskTreeModel model_;
    std::vector<std::string> closed_;  ///< last, by the user
    RecentImages recent_;
    ImageOpener images_;
    bool isReopening_ = false;
    bool hasStarted_ = false;
    DiskScan scan_;
    DiskWatch watch_;
};

}  // namespace orvane::desktop
