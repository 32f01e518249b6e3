// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/session/SessionBuses.h"

#include <optional>
#include <string>

namespace orvane::desktop {

/// How far a job is, beside the program's icon in the desktop's task bar or dock: the signal
/// com.canonical.Unity.LauncherEntry.Update, which KDE Plasma, and GNOME with a dock, listen to.
/// Where nobody does, nothing happens. Main thread.
class TaskBarProgress {
public:
    /// `entry` is the name of the program's desktop file, without its ending.
    TaskBarProgress(BusLookup bus, std::string entry)
        : bus_(std::move(bus)), entry_(std::move(entry))
    {
    }

    /// From 0 to 100; none when no job runs. Sent for every whole per cent.
    void show(std::optional<double> percent);

private:
    const BusLookup bus_;
    const std::string entry_;
    int shown_ = -1;  ///< per cent; -1 for none
};

}  // namespace orvane::desktop
