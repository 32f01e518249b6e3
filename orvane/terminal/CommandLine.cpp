// SPDX-License-Identifier: Apache-2.0
#include "orvane/terminal/CommandLine.h"

#include "contract/foundation/UTF8.h"
#include "contract/pellar/MessageKeys.h"
#include "orvane/terminal/UsageErrors.h"

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

constexpr std::array<CommandText, 20> commandTexts{{
    {Command::Verify, "verify", "Look for damage; write nothing"},
    {Command::Repair, "repair", "Repair what can be repaired, then verify again"},
    {Command::VerifyPermissions, "verify-permissions",
     "Compare the permissions of installed files with what their packages say"},
    {Command::RepairPermissions, "repair-permissions",
     "Set the permissions of installed files right"},
    {Command::Undo, "undo", "Take the last repair back: the disk is as it was before"},
    {Command::Finish, "finish", "Complete a repair that was interrupted while it was written"},
    {Command::List, "list", "Show disks, their last verdict and what can be done with them"},
    {Command::History, "history", "Show what earlier checks found"},
    {Command::Report, "report", "Write what is known of disks and their checks, to be passed on"},
    {Command::ScheduledCheck, "scheduled-check",
     "Verify what is not in use, for a timer: unmounts nothing, tells the journal"},
    {Command::Metrics, "metrics", "Write the last verdicts and times for Prometheus"},
    {Command::Notify, "notify",
     "Tell the desktop what scheduled checks have found since it was told last"},
    {Command::Mount, "mount", "Mount volumes, where the system chooses to"},
    {Command::Unmount, "unmount", "Unmount volumes"},
    {Command::Eject, "eject", "Unmount all of a drive, and give the medium back"},
    {Command::Attach, "attach", "Make image files devices of the system, and print their names"},
    {Command::Detach, "detach", "Unmount all of an attached image, and take it off its device"},
    {Command::Show, "show", "Show what another module says of disks, and press its buttons"},
    {Command::Modules, "modules", "List the modules that are found, and why one is refused"},
    {Command::Help, "help", "Explain a command or a topic, or list both"},
}};

constexpr const char* imageHelp = "An image file";
constexpr const char* diskHelp = "A device, an image file, a mount point, LABEL=… or UUID=…";

constexpr const char* description =
    "Fixwell checks disks, tells what was found and what it means, and repairs.";
constexpr const char* footer =
    "Exit status, added up over the disks: 0 sound, 1 damage found and repaired, 4 damage left, "
    "8 could not be checked, undone or finished, or not conclusive, 16 wrong usage, 32 stopped.";

// A value's name is its choices, if it has some: help, the manual and completions tell them.
constexpr const char* colorings = "auto|always|never";
constexpr const char* logLevels = "0|1|2|3";

void addSharedOptions(CLI::App& app, Request& request, const Translator& texts)
{
    app.set_help_flag("-h,--help", texts.text("Show how the program, or a command, is used"));
    app.set_version_flag("--version", std::string(),
                         texts.text("Show this program's version and those of the checking tools"));
    app.add_flag_callback(
        "--details", [&request] { request.showsDetails = true; },
        texts.text("Show every line (else the stored preference)"));
    app.add_flag_callback(
        "--brief", [&request] { request.showsDetails = false; },
        texts.text("Show headings and main lines only"));
    app.add_flag("--json", request.isJSON, texts.text("One JSON object per line"));
    app.add_flag("--yes", request.confirms, texts.text("Confirm the startup-disk warning"));
    const std::map<std::string, Coloring> meanings{
        {"auto", Coloring::Auto}, {"always", Coloring::Always}, {"never", Coloring::Never}};
    app.add_option("--color", request.coloring, texts.text("Whether there are colours"))
        ->transform(CLI::CheckedTransformer(meanings).description(""))
        ->type_name(colorings);
    app.add_flag_callback(
        "--no-progress", [&request] { request.showsProgress = false; },
        texts.text("No live progress line"));
    app.add_flag_callback(
        "--no-pager", [&request] { request.usesPager = false; },
        texts.text("Do not show long output page by page"));
    app.add_option("--log-level", request.logLevel,
                   texts.text("Developers' log lines up to this level on standard error"))
        ->check(CLI::Range(0, 3).description(""))
        ->type_name(logLevels);
    app.add_flag("--trace", request.tracesCommands,
                 texts.text("Print every command before it runs, and why an action is refused"));
}

/// How a repair is done; it is tried first where nothing else is said.
void addRepairOptions(CLI::App& command, Request& request, const Translator& texts)
{
    pellar::RepairPolicy& policy = request.repairPolicy;
    CLI::Option* const preview = command.add_flag("--preview", policy.isPreview,
                                                  texts.text("Try the repair, and write nothing"));
    command
        .add_option("--keep", policy.keptImage,
                    texts.text("Write the repaired volume to this new file"))
        ->type_name("FILE")
        ->needs(preview)
        ->excludes("--partition-map");
    CLI::Option* const direct =
        command.add_flag("--direct", policy.isDirect,
                         texts.text("Let the tool write to the disk itself; cannot be undone"));
    CLI::Option* const unproven =
        command.add_flag("--apply-unproven", policy.appliesUnproven,
                         texts.text("Apply the repair also where it would leave damage"));
    CLI::Option* const noUndo = command.add_flag_callback(
        "--no-undo", [&policy] { policy.keepsUndo = false; },
        texts.text("Do not keep what the repair overwrites"));
    for (CLI::Option* const other : {direct, unproven, noUndo})
        preview->excludes(other);
    direct->excludes(unproven);
}

void addMetricsOptions(CLI::App& command, Request& request, const Translator& texts)
{
    CLI::Option* const output = command
                                    .add_option("--output", request.output,
                                                texts.text("Replace this file instead of printing"))
                                    ->type_name("FILE");
    command
        .add_flag("--if-directory-exists", request.needsNoDirectory,
                  texts.text("Write nothing where there is no directory for the file"))
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

/// What the parser's rules cannot say; empty when there is nothing to object to.
std::string objectionTo(Request& request, const Translator& texts)
{
    if (request.command == Command::Report && request.isJSON)
        return texts.text(
            "“report --json”: a report is for people; “history --json” tells "
            "programs the same");
    if (request.command == Command::Metrics && request.isJSON)
        return texts.text(
            "“metrics --json”: metrics have a format of their own; “list --json” "
            "tells programs the same");
    std::filesystem::path& kept = request.repairPolicy.keptImage;
    if (!kept.empty() && request.disks.size() > 1)
        return texts.text("--keep takes one disk: there is one file for one volume");
    return makePathsAbsolute({&kept, &request.output})
               ? std::string()
               : texts.text("the current directory cannot be found");
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

void addDisks(CLI::App& command, Command chosen, Request& request, const Translator& texts)
{
    const bool takesImages = chosen == Command::Attach;
    CLI::Option* const disks = command
                                   .add_option(takesImages ? "IMAGE" : "DISK", request.disks,
                                               texts.text(takesImages ? imageHelp : diskHelp))
                                   ->type_name("")
                                   ->required(needsDisks(chosen));
    if (chosen == Command::ScheduledCheck)
        command
            .add_option("--instance", request.unitInstance,
                        texts.text("The disk of a unit, as systemd-escape(1) writes it; or “all”"))
            ->type_name("NAME")
            ->excludes(disks);
}

void addCommand(CLI::App& app, const CommandText& text, Request& request, const Translator& texts)
{
    CLI::App& command = *app.add_subcommand(text.name, texts.text(text.text));
    command.callback([&request, chosen = text.command] { request.command = chosen; });
    command.fallthrough();
    if (text.command == Command::Notify || text.command == Command::Modules)
        return;
    if (text.command == Command::Show) {
        command
            .add_option("MODULE", request.module,
                        texts.text("The module, as “fixwell modules” names it"))
            ->type_name("")
            ->required();
        command
            .add_option("--press", request.pressedButton,
                        texts.text("Press this button of the module, and wait until its work is "
                                   "done"))
            ->type_name("BUTTON");
    }
    const bool takesImages = text.command == Command::Attach;
    if (text.command == Command::Help)
        command
            .add_option("TOPIC", request.topic, texts.text("A command, or a page of the manual"))
            ->type_name("");
    else
        addDisks(command, text.command, request, texts);
    if (takesImages)
        command.add_flag("--read-only", request.attachesReadOnly,
                         texts.text("Let nobody write to it"));
    if (text.command == Command::History)
        command.add_flag("--clear", request.clearsHistory,
                         texts.text("Forget these disks' histories"));
    if (text.command == Command::Report) {
        command.add_flag("--html", request.isHTML, texts.text("As a page of HTML"));
        command.add_flag("--last", request.isLastRunAlone,
                         texts.text("The last check of each disk alone"));
    }
    if (treatsMaps(text.command))
        command.add_flag(
            "--partition-map", request.treatsPartitionMap,
            texts.text("Treat the disk's partition map (GPT or MBR) instead of its volumes"));
    if (text.command == Command::Undo)
        command
            .add_flag("--permissions", request.treatsPermissions,
                      texts.text("Take back what repair-permissions did"))
            ->excludes("--partition-map");
    if (text.command == Command::Verify)
        command.add_flag("--thorough", request.repairPolicy.isThorough,
                         texts.text("Try a repair as well where reading finds nothing"));
    if (text.command == Command::Repair)
        addRepairOptions(command, request, texts);
    if (text.command == Command::VerifyPermissions || text.command == Command::RepairPermissions)
        command.add_flag("--fetch-archives", request.fetchesArchives,
                         texts.text("Fetch package archives over the network (with apt) where "
                                    "nothing here says what permissions their files have"));
    if (text.command == Command::Metrics)
        addMetricsOptions(command, request, texts);
}

Ending wrongUsage(std::string_view why, const Translator& texts)
{
    return {exitUsage, "fixwell: " + contract::printable(why) + "\n" +
                           texts.text("Try “fixwell --help”.") + "\n"};
}

std::unique_ptr<CLI::App> makeParser(Request& request, const Translator& texts)
{
    auto app = std::make_unique<CLI::App>(texts.text(description), "fixwell");
    app->footer(texts.text(footer));
    app->require_subcommand(1);
    addSharedOptions(*app, request, texts);
    for (const CommandText& text : commandTexts)
        addCommand(*app, text, request, texts);
    return app;
}

manual::OptionEntry entryOf(const CLI::Option& option)
{
    const auto& shortNames = option.get_snames();
    return {"--" + option.get_lnames().front(),
            shortNames.empty() ? std::string() : "-" + shortNames.front(),
            option.get_expected_max() == 0 ? std::string() : option.get_type_name(),
            option.get_description()};
}

/// The parser repeats the option for help in every command; it is told of once.
manual::CommandEntry entryOf(const CLI::App& parser)
{
    manual::CommandEntry entry{parser.get_name(), parser.get_description(), {}, {}};
    for (const CLI::Option* const option : parser.get_options()) {
        const bool isMany = option->get_expected_max() > 1;
        if (option->get_positional())
            entry.arguments.push_back({option->get_name(true), option->get_description(),
                                       option->get_required(), isMany});
        else if (option != parser.get_help_ptr() || parser.get_parent() == nullptr)
            entry.options.push_back(entryOf(*option));
    }
    return entry;
}

manual::CommandTree treeOf(const CLI::App& parser)
{
    manual::CommandEntry program = entryOf(parser);
    manual::CommandTree tree{program.name, program.text, {}, program.options, parser.get_footer()};
    for (const CLI::App* const command : parser.get_subcommands({}))
        tree.commands.push_back(entryOf(*command));
    return tree;
}

/// "fixwell --help", or "fixwell COMMAND --help".
Request helpRequest(const CLI::App& parser, Request request)
{
    request.command = Command::Help;
    request.wantsUsage = true;
    request.usesPager = false;
    const auto chosen = parser.get_subcommands();
    request.topic = chosen.empty() ? std::string() : chosen.front()->get_name();
    return request;
}

}  // namespace

pellar::Result<Request, Ending> readCommandLine(int argc, const char* const* argv,
                                                const Translator& texts)
{
    Request request;
    const auto parser = makeParser(request, texts);
    try {
        parser->parse(argc, argv);
    } catch (const CLI::CallForHelp&) {
        return helpRequest(*parser, request);
    } catch (const CLI::CallForVersion&) {
        request.command = Command::Version;
        return request;
    } catch (const CLI::ParseError& error) {
        return wrongUsage(usageSentence(error, *parser, treeOf(*parser), texts), texts);
    }
    if (const std::string objection = objectionTo(request, texts); !objection.empty())
        return wrongUsage(objection, texts);
    return request;
}

manual::CommandTree commandTree(const Translator& texts)
{
    Request request;
    return treeOf(*makeParser(request, texts));
}

std::string_view nameOf(Command command)
{
    const auto found =
        std::find_if(commandTexts.begin(), commandTexts.end(),
                     [command](const CommandText& text) { return text.command == command; });
    return found == commandTexts.end() ? std::string_view() : found->name;
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
