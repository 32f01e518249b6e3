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

// The module leaves a failing drive out of its selection, so it has no reason of its own; nor has
// it one why a volume cannot be verified that the system or the user works on.
std::string unavailableReason(Session& session, const TerminalButton& button, const Disk& disk)
{
    const Translator& texts = session.host().translator();
    if (disk.hasSMARTError())
        return texts.text("Not available because the drive says that it is failing.");
    const std::string reason = button.reason();
    if (!reason.empty())
        return reason;
    const bool staysInUse = disk.isBootVolume() || disk.containUserHomeDirectory();
    const std::string why = staysInUse ? session.reasonAgainstLive(disk) : std::string();
    return why.empty() ? texts.text("Not available for this disk.")
                       : texts.sentence("Not available because the disk is in use: %@.", {why});
}

std::string unavailableSentence(Session& session, const TerminalButton& button,
                                const NamedDisk& disk)
{
    return fixwell::format(
        "%@: %@: %@", {disk.name, button.title(), unavailableReason(session, button, *disk.disk)});
}

}  // namespace orvane
