// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/ProgramStart.h"
#include "orvane/support/modules/ModuleSearch.h"
#include "orvane/support/texts/Catalogue.h"
#include "orvane/support/texts/Language.h"
#include "orvane/terminal/Commands.h"

#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <exception>
#include <memory>
#include <utility>

namespace orvane {
namespace {

bool isTerminal()
{
    const char* const type = std::getenv("TERM");
    return ::isatty(STDOUT_FILENO) == 1 && type != nullptr && std::string_view(type) != "dumb";
}

/// NO_COLOR is the informal standard for "no colours, please".
bool wantsColors(const Request& request)
{
    if (request.coloring != Coloring::Auto)
        return request.coloring == Coloring::Always;
    const char* const noColor = std::getenv("NO_COLOR");
    return isTerminal() && (noColor == nullptr || *noColor == '\0');
}

std::unique_ptr<Reporter> makeReporter(const Request& request)
{
    if (request.isJSON)
        return makeJSONReporter();
    TextReporterOptions options;
    options.translate =
        [texts = std::make_shared<Catalogue>(hostBundleDirectory(runningExecutable()) / "locale")](
            std::string_view key) {
            return texts->translate("Orvane", key);
        };
    options.colors = wantsColors(request);
    options.showsProgress = request.showsProgress && isTerminal();
    return makeTextReporter(std::move(options));
}

int carryOut(const Request& request, Session& session, Reporter& reporter)
{
    switch (request.command) {
        case Command::Mount:
        case Command::Unmount:
        case Command::Eject:
        case Command::Detach: return runDiskAction(request, session, reporter);
        case Command::Attach: return runAttach(request, session, reporter);
        case Command::Report: return runReport(request, session);
        case Command::Metrics: return runMetrics(request, session, reporter);
        case Command::Notify: return runNotify(session, reporter);
        case Command::Modules: return runModules(session, reporter);
        default: break;  // what needs the module
    }
    const bool isShow = request.command == Command::Show;
    if (const auto loaded = isShow ? session.loadModule(request.module) : session.loadModule();
        !loaded) {
        reporter.warning(loaded.error().message);
        return exitUnchecked;
    }
    switch (request.command) {
        case Command::List: return runList(request, session, reporter);
        case Command::ScheduledCheck: return runScheduledCheck(request, session, reporter);
        case Command::Undo:
        case Command::Finish: return runUndo(request, session, reporter);
        case Command::Show: return runShow(request, session, reporter);
        case Command::History: return runHistory(request, session, reporter);
        default: return runCheck(request, session, reporter);
    }
}

int run(int argc, const char* const* argv)
{
    setInheritanceRight();
    adoptUserLocale();
    const auto request = readCommandLine(argc, argv);
    if (!request) {
        const Ending& ending = request.error();
        std::fputs(ending.text.c_str(), ending.status == exitSound ? stdout : stderr);
        return ending.status;
    }
    const std::unique_ptr<Reporter> reporter = makeReporter(*request);
    int status = 0;
    {
        Session session(*request, *reporter);
        status = carryOut(*request, session, *reporter);
    }
    return reporter->end() ? status : status | exitUnchecked;
}

}  // namespace
}  // namespace orvane

int main(int argc, char** argv)
{
    try {
        return orvane::run(argc, argv);
    } catch (const std::exception& error) {
        std::fprintf(stderr, "fixwell: unexpected failure: %s\n", error.what());
        return orvane::exitUnchecked;
    }
}
