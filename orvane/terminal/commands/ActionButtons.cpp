// SPDX-License-Identifier: Apache-2.0
#include "orvane/terminal/commands/ActionButtons.h"

#include <algorithm>

namespace orvane {

const ActionButton& actionButtonFor(Command command)
{
    const auto found =
        std::find_if(actionButtons.begin(), actionButtons.end(),
                     [command](const ActionButton& action) { return action.command == command; });
    return found == actionButtons.end() ? actionButtons.front() : *found;
}

std::string unavailableReason(Session& session, const TerminalButton& button, const Disk& disk)
{
    if (!disk.hasSMARTError() && !button.reason().empty())
        return button.reason();
    const std::string reason = session.reasonOfHost(disk);
    return reason.empty() ? session.host().translator().text("Not available for this disk.")
                          : reason;
}

std::string damagedMapSentence(Session& session, const NamedDisk& image)
{
    return session.host().translator().sentence(
        "the partition map of “%@” is damaged; --partition-map checks and repairs it",
        {image.name});
}

std::string unavailableSentence(Session& session, const TerminalButton& button,
                                const NamedDisk& disk)
{
    return contract::format(
        "%@: %@: %@", {disk.name, button.title(), unavailableReason(session, button, *disk.disk)});
}

}  // namespace orvane
