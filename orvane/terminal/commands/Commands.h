// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/terminal/CommandLine.h"
#include "orvane/terminal/Reporter.h"
#include "orvane/terminal/Session.h"

#include <memory>
#include <string>
#include <vector>

namespace orvane {

/// A disk as the user named it.
struct NamedDisk {
    std::string name;
    std::shared_ptr<Disk> disk;
};

/// Finds each disk; one that cannot be found is reported, and adds exitUnchecked to `status`.
/// `meant` is asked what a name stands for here, if not for itself.
std::vector<NamedDisk> findDisks(const std::vector<std::string>& names, Session& session,
                                 Reporter& reporter, int& status,
                                 std::string (*meant)(const std::string& name) = nullptr);

// Each answers the exit status.

/// Verify or repair: all disks together as one job, as if they were selected in a window.
int runAction(const Request& request, Session& session, Reporter& reporter);
int runList(const Request& request, Session& session, Reporter& reporter);
int runHistory(const Request& request, Session& session, Reporter& reporter);
/// Mount, unmount, eject or detach: one disk after the other.
int runDiskAction(const Request& request, Session& session, Reporter& reporter);
int runAttach(const Request& request, Session& session, Reporter& reporter);

}  // namespace orvane
