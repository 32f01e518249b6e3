// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/ModuleTabs.h"

#include <map>
#include <string>
#include <string_view>

namespace orvane::desktop {

/// What the window says beside the modules: why a button is grey, and why a log is empty. Main
/// thread.
class ModuleHints {
public:
    /// The library outlives this object.
    ModuleHints(const SessionParts& parts, const pellar::Manager& library)
        : at_(parts), library_(library)
    {
    }
    ModuleHints(const ModuleHints&) = delete;
    ModuleHints& operator=(const ModuleHints&) = delete;

    /// After whatever changes what can be done, or what there is to be seen.
    void refresh();

private:
    using ReasonsByButton = std::map<std::string_view, std::string>;

    void tellEmptyText();
    void tellReasons();
    std::string reasonFor(const Disk& disk, std::string_view button);
    ReasonsByButton reasonsByDisk();
    std::string emptyText();
    std::string text(std::string_view key) { return at_.host.translator().text(key); }

    const SessionParts at_;
    const pellar::Manager& library_;
    bool isAwaited_ = false;
};

}  // namespace orvane::desktop
