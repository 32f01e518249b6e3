// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/ProgramStart.h"
#include "orvane/support/modules/ModuleSearch.h"
#include "orvane/support/texts/Catalogue.h"
#include "orvane/support/texts/Language.h"
#include "orvane/terminal/CommandLine.h"
#include "orvane/terminal/ExitStatus.h"
#include "orvane/terminal/JSONReporter.h"
#include "orvane/terminal/Session.h"
#include "orvane/terminal/TextReporter.h"
#include "orvane/terminal/commands/Commands.h"

#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <exception>
#include <memory>
#include <optional>

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
        return std::make_unique<JSONReporter>();
    TextReporter::Options options;
    options.translate =
        [texts = std::make_shared<Catalogue>(hostBundleDirectory(runningExecutable()) / "locale")](
            std::string_view key) {
            return texts->translate("Orvane", key);
        };
    options.colors = wantsColors(request);
    options.showsProgress = request.showsProgress && isTerminal();
    return std::make_unique<TextReporter>(options);
}

/// What needs no module.
std::optional<int> carryOutAlone(const Request& request, Session& session, Reporter& reporter)
{
    switch (request.command) {
        case Command::Mount:
        case Command::Unmount:
        case Command::Eject:
        case Command::Detach: return runDiskAction(request, session, reporter);
        case Command::Attach: return runAttach(request, session, reporter);
        default: return std::nullopt;
    }
}

int carryOut(const Request& request, Session& session, Reporter& reporter)
{
    if (const auto status = carryOutAlone(request, session, reporter))
        return *status;
    if (const auto loaded = session.loadModule(); !loaded) {
        reporter.warning(loaded.error().message);
        return exitUnchecked;
    }
    switch (request.command) {
        case Command::List: return runList(request, session, reporter);
        case Command::History: return runHistory(request, session, reporter);
        default: return runAction(request, session, reporter);
    }
}

int run(int argc, const char* const* argv)
{
    setInheritanceRight();
    adoptUserLocale();
    const auto read = readCommandLine(argc, argv);
    if (const auto* const ending = std::get_if<Ending>(&read)) {
        std::fputs(ending->text.c_str(), ending->status == exitSound ? stdout : stderr);
        return ending->status;
    }
    const Request& request = std::get<Request>(read);
    const std::unique_ptr<Reporter> reporter = makeReporter(request);
    int status = 0;
    {
        Session session(request, *reporter);
        status = carryOut(request, session, *reporter);
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
