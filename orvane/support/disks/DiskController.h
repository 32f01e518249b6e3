// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/support/OVDiskController.h"
#include "orvane/support/disks/Disk.h"
#include "orvane/support/files/Failure.h"

#include <functional>
#include <memory>
#include <set>
#include <string>
#include <string_view>
#include <vector>

namespace orvane {

/// The disks that the host knows: those of the system, the image files that the user has named,
/// and the attached contents of images. Main thread only; posts what happens to the disks.
class DiskController final : public contract::OVDiskController {
public:
    /// What reaches outside. An empty function is an operation that cannot be done here.
    struct Hooks {
        std::function<Result<void, Failure>(const Disk& disk)> mount;
        std::function<Result<void, Failure>(const Disk& disk)> eject;
        /// How notifyFrontmostModulesOnly delivers.
        std::function<void(contract::Name name, const contract::Notification&)> notifyFrontmost;
        WarningSink warn;
    };

    /// The notification centre must outlive this object.
    DiskController(contract::NotificationCenter& center, Disk::Surroundings surroundings);

    Hooks& hooks() { return hooks_; }

    /// The top of every tree of disks, in the order in which they became known.
    const std::vector<std::shared_ptr<Disk>>& roots() const { return roots_; }
    std::shared_ptr<Disk> diskNamed(std::string_view identifier) const;
    /// The first in tree order for which `isMeant` answers YES; none when there is none.
    std::shared_ptr<Disk> find(const std::function<bool(const Disk&)>& isMeant) const;

    /// Takes in an image file that is not attached, or, until the next `synchronize`, a device that
    /// the system's list does not have; the one known already when there is one.
    std::shared_ptr<Disk> add(const DiskFacts& facts);
    /// Makes the disk of an attached image known, with all its parts. Where it is known already,
    /// it is brought up to date: what is in the image may have changed.
    void adopt(const std::shared_ptr<Disk>& top);
    void adopt(const DiskTree& top);
    /// Brings the system's disks up to date: what is new appears, what has gone is ejected, what
    /// is different is changed or unmounted. Image files and their contents stay.
    void synchronize(const std::vector<DiskTree>& systemDisks);

    /// A job works on these disks. Should one of them go, that is told, but it keeps its place
    /// until `release`, and no other disk gets its name.
    void hold(std::vector<std::shared_ptr<Disk>> disks);
    /// Forgets, without a further word, what has gone while it was held; NO when nothing has.
    bool release();

    contract::OVDiskPointer diskWithIdentifier(std::string_view identifier) override;
    contract::OVDiskPointer diskWithKRDisk(const contract::DiskReferencePointer& disk) override;
    contract::OVDiskPointer findOrCreateOVDisk(const contract::DiskReferencePointer& disk) override;
    /// The main thread sees an attached image here first, so an unknown disk is adopted.
    std::vector<contract::OVDiskPointer> viewablePartitions(
        const contract::OVDiskPointer& disk) override;
    /// A module asks for this after every job that failed. Only what was mounted when the disks
    /// were last held is: a volume that was at rest, and is perhaps damaged, stays so.
    void mountDisk(const contract::OVDiskPointer& disk, bool includeChildren,
                   bool synchronous) override;
    void ejectDisk(const contract::OVDiskPointer& disk, bool synchronous) override;
    void notifyFrontmostModulesOnly(contract::Name name,
                                    const contract::Notification& notification) override;

private:
    struct PartsReadAgain;

    PartsReadAgain readAgain(const Disk& disk, const std::vector<DiskTree>& trees) const;
    void post(contract::Name name, const std::shared_ptr<Disk>& disk);
    std::shared_ptr<Disk> diskReferredTo(const contract::DiskReferencePointer& reference);
    void forgetAsked();
    void appear(const std::shared_ptr<Disk>& disk);
    bool isHeld(const std::shared_ptr<Disk>& disk) const;
    void tellGone(const std::shared_ptr<Disk>& disk);
    void forget(const std::shared_ptr<Disk>& root);
    void update(const std::shared_ptr<Disk>& disk, const DiskTree& tree);
    void bringUpToDate(const std::shared_ptr<Disk>& image, const DiskFacts& contents);
    void warn(const Result<void, Failure>& outcome);

    contract::NotificationCenter& center_;
    Disk::Surroundings surroundings_;
    Hooks hooks_;
    std::vector<std::shared_ptr<Disk>> roots_;
    std::vector<std::shared_ptr<Disk>> held_;
    std::set<std::string> mountedWhenHeld_;  ///< their identifiers

    // The disk of the job at hand: the library asks for it with every line of output.
    std::shared_ptr<Disk> asked_;
    contract::DiskReferencePointer askedReference_;
};

/// The disk and everything below it, each before its children.
[[nodiscard]] std::vector<std::shared_ptr<Disk>> withParts(const std::shared_ptr<Disk>& disk);

}  // namespace orvane
