// SPDX-License-Identifier: Apache-2.0
#include "orvane/jobs/LibraryTexts.h"
#include "orvane/privileges/LibraryOptions.h"
#include "orvane/support/ProgramStart.h"
#include "orvane/support/modules/ModuleSearch.h"
#include "orvane/support/texts/Catalogue.h"
#include "orvane/support/texts/Language.h"
#include "orvane/terminal/Commands.h"
#include "orvane/terminal/ManualCommands.h"
#include "orvane/terminal/Pager.h"

#include <cstdio>
#include <exception>
#include <memory>
#include <utility>

namespace orvane {
namespace {

Translator translatorOf(const Catalogue& texts)
{
    Translator translator;
    translator.text = [&texts](std::string_view key) {
        return texts.translate("Orvane", key);
    };
    translator.plural = [&texts](std::string_view one, std::string_view many, long count) {
        return texts.translatePlural("Orvane", one, many, count);
    };
    return translator;
}

std::unique_ptr<Reporter> makeReporter(const Request& request, const Translator& texts,
                                       const TerminalLook& look, bool isPaged)
{
    if (request.isJSON)
        return makeJSONReporter();
    TextReporterOptions options;
    options.translate = texts.text;
    options.colors = look.colors;
    options.showsProgress = request.showsProgress && look.isTerminal && !isPaged;
    return makeTextReporter(std::move(options));
}

/// What there may be much of to read.
bool isToBePaged(const Request& request, const TerminalLook& look)
{
    return look.isTerminal && request.usesPager && !request.isJSON &&
           (request.command == Command::Help || request.command == Command::Report ||
            (request.command == Command::History && !request.clearsHistory));
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

int runWithSession(const Request& request, const Translator& texts, const TerminalLook& look,
                   bool isPaged)
{
    const std::unique_ptr<Reporter> reporter = makeReporter(request, texts, look, isPaged);
    int status = 0;
    {
        Session session(request, *reporter);
        status = carryOut(request, session, *reporter);
    }
    if (reporter->end())
        return status;
    Reporter::writeError(texts.text("not all of the output could be written"));
    return status | exitUnchecked;
}

int runRequest(const Request& request, const std::filesystem::path& bundle,
               const Catalogue& catalogue)
{
    const Translator texts = translatorOf(catalogue);
    const TerminalLook look = lookOf(request);
    const auto pager = isToBePaged(request, look)
                           ? Pager::start(pagerCommand(environmentValue("PAGER")))
                           : nullptr;
    switch (request.command) {
        case Command::Help: return runHelp(request, bundle / "help", texts, look);
        case Command::Version:
            return runVersion(libraryOptions(userXDGPaths(), LibraryTexts(catalogue)).toolPath,
                              texts, look);
        default: return runWithSession(request, texts, look, pager != nullptr);
    }
}

/// A key is waited for by somebody, and a drive may sleep: what udev knows is enough, where it is.
DiskSources disksForCompletion()
{
    DiskSources sources;
    std::error_code error;
    sources.opensDevices = !std::filesystem::exists(sources.udevData, error);
    return sources;
}

int run(int argc, const char* const* argv)
{
    setInheritanceRight();
    adoptUserLocale();
    const std::filesystem::path bundle = hostBundleDirectory(runningExecutable());
    const Catalogue catalogue(bundle / "locale");
    if (const auto status = runCompletion({argv + 1, argv + argc}, bundle / "help",
                                          disksForCompletion(), translatorOf(catalogue)))
        return *status;
    const auto request = readCommandLine(argc, argv, translatorOf(catalogue));
    if (!request) {
        std::fputs(request.error().text.c_str(), stderr);
        return request.error().status;
    }
    return runRequest(*request, bundle, catalogue);
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
