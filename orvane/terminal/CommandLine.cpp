// SPDX-License-Identifier: Apache-2.0
#include "orvane/terminal/CommandLine.h"

#include "contract/foundation/UTF8.h"
#include "contract/pellar/MessageKeys.h"

#include <CLI/CLI.hpp>

#include <algorithm>
#include <array>

namespace orvane {
namespace {

struct CommandText {
    Command command;
    const char* name;
    const char* text;
};

constexpr std::array<CommandText, 19> commandTexts{{
    {Command::Verify, "verify", "Look for damage; write nothing"},
    {Command::Repair, "repair", "Repair what can be repaired, then verify again"},
    {Command::VerifyPermissions, "verify-permissions",
     "Compare the permissions of installed files with what their packages say"},
    {Command::RepairPermissions, "repair-permissions", "Set them right"},
    {Command::Undo, "undo", "Take the last repair back: the disk is as it was before"},
    {Command::Finish, "finish", "Complete a repair that was interrupted while it was written"},
    {Command::List, "list", "Show disks, their last verdict and what can be done with them"},
    {Command::History, "history", "Show what earlier checks found"},
    {Command::Report, "report", "Write what is known of disks and their checks, to be passed on"},
    {Command::ScheduledCheck, "scheduled-check",
     "Verify what is not in use, for a timer: unmounts nothing, tells the journal"},
    {Command::Metrics, "metrics", "Write the last verdicts and times for Prometheus"},
    {Command::Notify, "notify", "Tell the desktop what scheduled checks have found since it was told last"},
    {Command::Mount, "mount", "Mount volumes, where the system chooses to"},
    {Command::Unmount, "unmount", "Unmount volumes"},
    {Command::Eject, "eject", "Unmount all of a drive, and give the medium back"},
    {Command::Attach, "attach", "Make image files devices of the system, and print their names"},
    {Command::Detach, "detach", "Unmount all of an attached image, and take it off its device"},
    {Command::Show, "show", "Show what another module says of disks, and press its buttons"},
    {Command::Modules, "modules", "List the modules that are found, and why one is refused"},
}};

constexpr const char* imageHelp = "An image file";
constexpr const char* diskHelp = "A device, an image file, a mount point, LABEL=… or UUID=…";

constexpr const char* footer =
    "\nExit status, added up over the disks: 0 sound, 1 damage found and repaired, 4 damage left,\n"
    "8 could not be checked, undone or finished, or not conclusive, 16 wrong usage, 32 stopped.";

void addSharedOptions(CLI::App& app, Request& request)
{
    app.add_flag_callback(
        "--details", [&request] { request.showsDetails = true; },
        "Show every line (else the stored preference)");
    app.add_flag_callback(
        "--brief", [&request] { request.showsDetails = false; },
        "Show headings and main lines only");
    app.add_flag("--json", request.isJSON, "One JSON object per line");
    app.add_flag("--yes", request.confirms, "Confirm the startup-disk warning");
    const std::map<std::string, Coloring> colorings{
        {"auto", Coloring::Auto}, {"always", Coloring::Always}, {"never", Coloring::Never}};
    app.add_option("--color", request.coloring, "auto, always or never")
        ->transform(CLI::CheckedTransformer(colorings).description(""))
        ->type_name("WHEN");
    app.add_flag_callback(
        "--no-progress", [&request] { request.showsProgress = false; }, "No live progress line");
    app.add_option("--log-level", request.logLevel,
                   "Developers' log lines up to this level (1 to 3) on standard error")
        ->check(CLI::Range(0, 3).description(""))
        ->type_name("N");
    app.add_flag("--trace", request.tracesCommands,
                 "Print every command before it runs, and why an action is refused");
}

/// How a repair is done; it is tried first where nothing else is said.
void addRepairOptions(CLI::App& command, Request& request)
{
    pellar::RepairPolicy& policy = request.repairPolicy;
    CLI::Option* const preview =
        command.add_flag("--preview", policy.isPreview, "Try the repair, and write nothing");
    command.add_option("--keep", policy.keptImage, "Write the repaired volume to this new file")
        ->type_name("FILE")
        ->needs(preview)
        ->excludes("--partition-map");
    CLI::Option* const direct = command.add_flag(
        "--direct", policy.isDirect, "Let the tool write to the disk itself; cannot be undone");
    CLI::Option* const unproven =
        command.add_flag("--apply-unproven", policy.appliesUnproven,
                         "Apply the repair also where it would leave damage");
    CLI::Option* const noUndo = command.add_flag_callback(
        "--no-undo", [&policy] { policy.keepsUndo = false; },
        "Do not keep what the repair overwrites");
    for (CLI::Option* const other : {direct, unproven, noUndo})
        preview->excludes(other);
    direct->excludes(unproven);
}

void addMetricsOptions(CLI::App& command, Request& request)
{
    CLI::Option* const output =
        command.add_option("--output", request.output, "Replace this file instead of printing")
            ->type_name("FILE");
    command
        .add_flag("--if-directory-exists", request.needsNoDirectory,
                  "Write nothing where there is no directory for the file")
        ->needs(output);
}

bool makePathsAbsolute(std::initializer_list<std::filesystem::path*> paths)
{
    std::error_code error;
    for (std::filesystem::path* const path : paths)
        if (!path->empty())
            *path = std::filesystem::absolute(*path, error);
    return !error;
}

/// What the parser's rules cannot say; none when there is nothing to object to.
const char* objectionTo(Request& request)
{
    if (request.command == Command::Report && request.isJSON)
        return "a report is for people; “history --json” tells programs the same";
    if (request.command == Command::Metrics && request.isJSON)
        return "metrics have a format of their own; “list --json” tells programs the same";
    std::filesystem::path& kept = request.repairPolicy.keptImage;
    if (!kept.empty() && request.disks.size() > 1)
        return "--keep takes one disk: there is one file for one volume";
    return makePathsAbsolute({&kept, &request.output}) ? nullptr
                                                       : "the current directory cannot be found";
}

/// Without a disk they are about all of them.
bool needsDisks(Command command)
{
    return command != Command::List && command != Command::ScheduledCheck &&
           command != Command::Metrics;
}

bool treatsMaps(Command command)
{
    return command == Command::Verify || command == Command::Repair || command == Command::Undo ||
           command == Command::Finish;
}

void addCommand(CLI::App& app, const CommandText& text, Request& request)
{
    CLI::App& command = *app.add_subcommand(text.name, text.text);
    command.callback([&request, chosen = text.command] { request.command = chosen; });
    command.fallthrough();
    if (text.command == Command::Notify || text.command == Command::Modules)
        return;
    if (text.command == Command::Show) {
        command.add_option("MODULE", request.module, "The module, as “fixwell modules” names it")
            ->type_name("")
            ->required();
        command
            .add_option("--press", request.pressedButton,
                        "Press this button of the module, and wait until its work is done")
            ->type_name("BUTTON");
    }
    const bool takesImages = text.command == Command::Attach;
    CLI::Option& disks = *command
                              .add_option(takesImages ? "IMAGE" : "DISK", request.disks,
                                          takesImages ? imageHelp : diskHelp)
                              ->type_name("");
    if (takesImages)
        command.add_flag("--read-only", request.attachesReadOnly, "Let nobody write to it");
    if (needsDisks(text.command))
        disks.required();
    if (text.command == Command::History)
        command.add_flag("--clear", request.clearsHistory, "Forget these disks' histories");
    if (text.command == Command::Report) {
        command.add_flag("--html", request.isHTML, "As a page of HTML");
        command.add_flag("--last", request.isLastRunAlone, "The last check of each disk alone");
    }
    if (treatsMaps(text.command))
        command.add_flag("--partition-map", request.treatsPartitionMap,
                         "Treat the disk's partition map (GPT or MBR) instead of its volumes");
    if (text.command == Command::Undo)
        command
            .add_flag("--permissions", request.treatsPermissions,
                      "Take back what repair-permissions did")
            ->excludes("--partition-map");
    if (text.command == Command::Verify)
        command.add_flag("--thorough", request.repairPolicy.isThorough,
                         "Try a repair as well where reading finds nothing");
    if (text.command == Command::Repair)
        addRepairOptions(command, request);
    if (text.command == Command::VerifyPermissions || text.command == Command::RepairPermissions)
        command.add_flag("--fetch-archives", request.fetchesArchives,
                         "Fetch package archives over the network (with apt) where nothing here "
                         "says what permissions their files have");
    if (text.command == Command::ScheduledCheck)
        command
            .add_option("--instance", request.unitInstance,
                        "The disk of a unit, as systemd-escape(1) writes it; or “all”")
            ->type_name("NAME")
            ->excludes(&disks);
    if (text.command == Command::Metrics)
        addMetricsOptions(command, request);
}

Ending wrongUsage(std::string_view why)
{
    return {exitUsage,
            "fixwell: " + contract::printable(why) + "\nTry “fixwell --help”.\n"};
}

}  // namespace

pellar::Result<Request, Ending> readCommandLine(int argc, const char* const* argv)
{
    Request request;
    CLI::App app("Fixwell: checks disks, tells what was found and what it means, and repairs.",
                 "fixwell");
    app.footer(footer);
    app.require_subcommand(1);
    addSharedOptions(app, request);
    for (const CommandText& text : commandTexts)
        addCommand(app, text, request);
    try {
        app.parse(argc, argv);
        if (const char* const objection = objectionTo(request))
            return wrongUsage(objection);
        return request;
    } catch (const CLI::Success& asked) {
        std::ostringstream text;
        app.exit(asked, text, text);
        return Ending{exitSound, text.str()};
    } catch (const CLI::ParseError& error) {
        return wrongUsage(error.what());
    }
}

std::string_view nameOf(Command command)
{
    return std::find_if(commandTexts.begin(), commandTexts.end(),
                        [command](const CommandText& text) { return text.command == command; })
        ->name;
}

int exitStatusFor(std::string_view verdict)
{
    using namespace contract;
    if (verdict == kPLVerdictSound.text())
        return exitSound;
    if (verdict == kPLVerdictRepaired.text())
        return exitRepaired;
    if (verdict == kPLVerdictDamaged.text())
        return exitDamaged;
    if (verdict == kPLVerdictStopped.text())
        return exitStopped;
    return exitUnchecked;
}

}  // namespace orvane
