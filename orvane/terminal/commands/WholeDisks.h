// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/terminal/commands/Commands.h"

namespace orvane {

/// The whole disks behind what the user named, for the time in which their partition maps are
/// treated: an image is attached, and detached again with this object.
class WholeDisks {
public:
    /// A disk that has no partition map is reported, left out, and adds exitUnchecked to `status`.
    /// Both references outlive this object.
    WholeDisks(const std::vector<NamedDisk>& named, Session& session, Reporter& reporter,
               int& status);
    WholeDisks(const WholeDisks&) = delete;
    WholeDisks& operator=(const WholeDisks&) = delete;
    ~WholeDisks();

    const std::vector<NamedDisk>& disks() const { return disks_; }

private:
    void add(const NamedDisk& named, Reporter& reporter, int& status);
    std::shared_ptr<Disk> wholeOf(const NamedDisk& named);
    std::string objection(const NamedDisk& named, const std::shared_ptr<Disk>& whole) const;

    Session& session_;
    std::vector<NamedDisk> disks_;
    std::vector<std::shared_ptr<Disk>> attached_;
};

}  // namespace orvane
