// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/terminal/Session.h"

#include <string>

namespace orvane {

// Each command answers the exit status.

/// Verify or repair: all disks together as one job, as if they were selected in a window.
int runCheck(const Request& request, Session& session, Reporter& reporter);
int runList(const Request& request, Session& session, Reporter& reporter);
int runHistory(const Request& request, Session& session, Reporter& reporter);
/// To standard output.
int runReport(const Request& request, Session& session);
/// Verifies without unmounting anything; a disk that is skipped for that is no failure.
int runScheduledCheck(const Request& request, Session& session, Reporter& reporter);
/// To standard output, or to the file that was asked for.
int runMetrics(const Request& request, Session& session, Reporter& reporter);
/// Of the checks that are bad news and newer than those that the user was told of.
int runNotify(Session& session, Reporter& reporter);
/// Undo or finish: one disk after the other.
int runUndo(const Request& request, Session& session, Reporter& reporter);
/// Mount, unmount, eject or detach: one disk after the other.
int runDiskAction(const Request& request, Session& session, Reporter& reporter);
int runAttach(const Request& request, Session& session, Reporter& reporter);

/// Exit status 0 unless a disk was not found, or the button could not be pressed.
int runShow(const Request& request, Session& session, Reporter& reporter);
/// Of those that are found; one that cannot be used adds exitUnchecked.
int runModules(Session& session, Reporter& reporter);

/// Why the button cannot be pressed for the selected disk: that its drive is failing, the module's
/// reason, or that there is none to be had.
std::string unavailableReason(Session& session, const TerminalButton& button, const Disk& disk);

/// That an image's partition map is damaged, and what can be done about it.
std::string damagedMapSentence(Session& session, const NamedDisk& image);

}  // namespace orvane
