// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/terminal/manual/CommandTree.h"
#include "pellar/jobs/JobOptions.h"
#include "pellar/outcome/Result.h"

#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace orvane {

// The bits of the exit status, or-ed over all disks, after fsck(8).
inline constexpr int exitSound = 0;
inline constexpr int exitRepaired = 1;   ///< damage was found and repaired
inline constexpr int exitDamaged = 4;    ///< damage is left
inline constexpr int exitUnchecked = 8;  ///< could not be checked, or not conclusively
inline constexpr int exitUsage = 16;
inline constexpr int exitStopped = 32;

/// For a verdict of the disk-management library; an unknown one counts as unchecked.
int exitStatusFor(std::string_view verdict);

enum class Command {
    Verify,
    Repair,
    VerifyPermissions,
    RepairPermissions,
    Undo,
    Finish,
    List,
    History,
    Report,
    ScheduledCheck,
    Metrics,
    Notify,
    Mount,
    Unmount,
    Eject,
    Attach,
    Detach,
    Show,
    Modules,
    Help,
    Version
};

enum class Coloring { Auto, Always, Never };

/// What the user asked for.
struct Request {
    Command command = Command::List;
    std::vector<std::string> disks;  ///< as named: device, image, mount point, LABEL=, UUID=
    std::string topic;               ///< of the help; empty: what topics there are
    bool wantsUsage = false;         ///< instead: the command line as a whole (--help)
    std::string module;              ///< to be shown
    std::string pressedButton;       ///< of it; empty for none
    bool attachesReadOnly = false;
    bool clearsHistory = false;
    bool isHTML = false;                ///< a report
    bool isLastRunAlone = false;        ///< in it
    bool treatsPartitionMap = false;    ///< the disks' maps, not their volumes
    bool treatsPermissions = false;     ///< of installed files; to undo alone
    pellar::RepairPolicy repairPolicy;  ///< the image to keep is named by an absolute path
    std::optional<std::string>
        unitInstance;                  ///< whose scheduled check it is, as systemd escapes it
    std::filesystem::path output;      ///< of metrics; absolute, or empty for standard output
    bool needsNoDirectory = false;     ///< nothing is written where that of `output` is missing
    bool fetchesArchives = false;      ///< of packages, over the network, to know permissions
    std::optional<bool> showsDetails;  ///< none: as stored in the preferences
    bool isJSON = false;
    bool confirms = false;  ///< answers the startup-disk warning
    Coloring coloring = Coloring::Auto;
    bool showsProgress = true;
    bool usesPager = true;  ///< where the output is long and goes to a terminal
    int logLevel = 0;       ///< developers' lines up to this level go to standard error
    bool tracesCommands = false;
};

/// The arguments are wrong; the program ends with this.
struct Ending {
    int status;
    std::string text;  ///< for standard error
};

/// A relative path is taken from the current directory. What is wrong is said in the language of
/// the texts, and names the option or the argument.
[[nodiscard]] pellar::Result<Request, Ending> readCommandLine(int argc, const char* const* argv,
                                                              const Translator& texts);

/// What can be said on the command line.
[[nodiscard]] manual::CommandTree commandTree(const Translator& texts);

/// As the user writes it.
std::string_view nameOf(Command command);

}  // namespace orvane
