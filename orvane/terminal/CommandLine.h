// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <optional>
#include <string>
#include <variant>
#include <vector>

namespace orvane {

enum class Command { Verify, Repair, VerifyPermissions, RepairPermissions, List, History };

enum class Coloring { Auto, Always, Never };

/// What the user asked for.
struct Request {
    Command command = Command::List;
    std::vector<std::string> disks;  ///< as named: device, image, mount point, LABEL=, UUID=
    bool clearsHistory = false;
    bool treatsPartitionMap = false;   ///< the disks' maps, not their volumes
    bool fetchesArchives = false;      ///< of packages, over the network, to know permissions
    std::optional<bool> showsDetails;  ///< none: as stored in the preferences
    bool isJSON = false;
    bool confirms = false;  ///< answers the startup-disk warning
    Coloring coloring = Coloring::Auto;
    bool showsProgress = true;
    int logLevel = 0;  ///< developers' lines up to this level go to standard error
    bool tracesCommands = false;
};

/// Help was asked for, or the arguments are wrong; the program ends with this.
struct Ending {
    int status;
    std::string text;  ///< for standard output when the status is 0, else for standard error
};

std::variant<Request, Ending> readCommandLine(int argc, const char* const* argv);

}  // namespace orvane
