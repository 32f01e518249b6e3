// SPDX-License-Identifier: Apache-2.0
// What other modules than the checking one have to show, and which there are.

#include "orvane/terminal/Commands.h"

#include <algorithm>
#include <string_view>

namespace orvane {
namespace {

constexpr std::string_view buttonSuffix = "Button";

/// "measureButton" is pressed as "measure".
std::string commandOf(const std::string& outlet)
{
    return outlet.ends_with(buttonSuffix) && outlet.size() > buttonSuffix.size()
               ? outlet.substr(0, outlet.size() - buttonSuffix.size())
               : outlet;
}

ModuleView viewOf(const Request& request, Session& session)
{
    const TerminalInterface& interface = session.interface();
    ModuleView view{request.module, session.module().displayName(), interface.texts(), {}};
    for (const auto& [outlet, button] : interface.buttons())
        view.buttons.push_back({commandOf(outlet), button->title(), button->isEnabled(),
                                button->isEnabled() ? "" : button->reason()});
    return view;
}

/// As a click does; NO when there is no such button or it cannot be pressed.
bool press(const Request& request, Session& session, Reporter& reporter)
{
    const auto buttons = session.interface().buttons();
    const auto found = std::ranges::find_if(buttons, [&](const auto& button) {
        return commandOf(button.first) == request.pressedButton;
    });
    if (found == buttons.end()) {
        reporter.warning(
            cannot("press", request.pressedButton, request.module + " has no such button").message);
        return false;
    }
    if (!found->second->isEnabled()) {
        reporter.warning(cannot("press", request.pressedButton, found->second->reason()).message);
        return false;
    }
    session.pressAndWait(session.button(found->first));
    return true;
}

}  // namespace

int runShow(const Request& request, Session& session, Reporter& reporter)
{
    int status = 0;
    std::vector<Session::DiskPointer> disks;
    for (const NamedDisk& named : session.findDisks(request.disks, status))
        disks.push_back(named.disk);
    if (disks.empty())
        return status;
    session.select(disks);
    if (!request.pressedButton.empty() && !press(request, session, reporter))
        status |= exitUnchecked;
    reporter.shown(viewOf(request, session));
    return session.wasStopped() ? status | exitStopped : status;
}

int runModules(Session& session, Reporter& reporter)
{
    int status = 0;
    for (const auto& bundle : findModuleBundles(session.moduleDirectories())) {
        ModuleLine line{bundle.stem(), bundle, {}};
        const auto loaded = loadModule(bundle);
        if (!loaded)
            line.refusal = loaded.error().message;
        else if (!shouldRun(*loaded, session.host()))
            line.refusal = cannot("use", loaded->name, "it says that it does not run here").message;
        status |= line.refusal.empty() ? 0 : exitUnchecked;
        reporter.found(line);
    }
    return status;
}

}  // namespace orvane
