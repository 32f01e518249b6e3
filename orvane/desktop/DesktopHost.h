// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/QtLoop.h"
#include "orvane/desktop/toolkit/Help.h"
#include "orvane/desktop/toolkit/QtAlerts.h"
#include "orvane/desktop/toolkit/QtControls.h"
#include "orvane/desktop/toolkit/QtInterface.h"
#include "orvane/desktop/toolkit/QtPasteboard.h"
#include "orvane/desktop/toolkit/QtPrinting.h"
#include "orvane/support/SupportHost.h"

namespace orvane::desktop {

/// The name of the program's desktop file (without its ending) and of its icon, by which the
/// desktop knows the window (packaging/desktop).
inline constexpr const char* desktopEntry = "org.orvane.Orvane";

/// The host on a desktop: the shared services, and the toolkit on Qt. Main thread.
class DesktopHost final : public SupportHost {
public:
    /// The loop outlives this object.
    DesktopHost(SupportOptions options, QtLoop& loop);

    /// The window that sheets are shown on.
    void setWindow(QWidget* window);
    /// Shows the sentences on one sheet, below a title that may be empty; nothing where there is
    /// none.
    void showSheet(const std::string& title, const std::vector<std::string>& sentences);

    QtAlerts& alerts() override { return alerts_; }
    contract::Events& events() override { return events_; }
    QtHelp& sharedHelpManager() override { return help_; }
    QtInterface& interfaceLoader() override { return interface_; }
    QtPasteboard& generalPasteboard() override { return pasteboard_; }
    QtPrinting& printing() override { return printing_; }

private:
    QtAlerts alerts_;
    QtEvents events_;
    QtHelp help_;
    QtInterface interface_;
    QtPasteboard pasteboard_;
    QtPrinting printing_;
};

}  // namespace orvane::desktop
