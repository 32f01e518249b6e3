// SPDX-License-Identifier: Apache-2.0
#include "orvane/terminal/TerminalHost.h"

namespace orvane {

TerminalHost::TerminalHost(SupportOptions options, MainLoop& loop, Interface& interface,
                           TerminalAlerts& alerts, Reporter& reporter,
                           std::optional<bool> showsDetails)
    : SupportHost(std::move(options), loop),
      preferences_(SupportHost::sharedPreferences(), showsDetails),
      interface_(interface),
      alerts_(alerts),
      reporter_(reporter)
{
    // Every volume of an image is there when the attachment has returned.
    threads().setAttachesSynchronously(true);
}

void TerminalHost::openHelpAnchor(std::string_view /*anchor*/)
{
    reporter_.warning(translator().text("Help is shown by “fixwell --help”."));
}

void TerminalHost::declareTypes(const std::vector<contract::PasteboardType>& /*types*/,
                                const void* /*owner*/)
{
    reporter_.warning(translator().text("Copying is done by the terminal."));
}

void TerminalHost::setData(std::string_view /*data*/, contract::PasteboardType /*type*/) {}

void TerminalHost::runPrintOperation(contract::OutlineView& /*view*/,
                                     const contract::PrintInfo& /*info*/, bool /*showsPanel*/,
                                     contract::Window* /*window*/)
{
    reporter_.warning(translator().text("Printing is done by redirecting “fixwell history”."));
}

}  // namespace orvane
