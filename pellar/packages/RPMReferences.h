// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/outcome/Result.h"
#include "pellar/packages/Accounts.h"
#include "pellar/packages/Reference.h"
#include "pellar/packages/RootDirectory.h"
#include "pellar/packages/TemporaryDirectory.h"
#include "pellar/process/ProcessRunner.h"
#include "pellar/texts/Sentence.h"

#include <filesystem>
#include <functional>
#include <optional>
#include <string>
#include <string_view>

namespace pellar {

/// What is asked of rpm(8) for each file of each package: the name comes last, because it may
/// hold anything but a line end.
inline constexpr std::string_view rpmFileFormat =
    "[%{FILEMODES:octal}\t%{FILESTATES}\t%{FILEVERIFYFLAGS}\t%{FILEFLAGS}\t%{FILEUSERNAME}\t"
    "%{FILEGROUPNAME}\t%{FILECAPS}\t%{FILEDIGESTS}\t%{FILENAMES}\n]";

enum class RPMLine { File, NotInstalled, Malformed };

struct RPMFile {
    RPMLine line = RPMLine::Malformed;
    Reference reference;
};

/// A line of that form. The owners' names are looked up in the system's own accounts; rpm itself
/// takes a name that is unknown for root's and finds nothing wrong with it, here it leaves the
/// file in doubt.
RPMFile parseRPMFile(std::string_view line, const Accounts& accounts, const PathAliases& aliases);

/// A copy of rpm's database in a directory of its own. rpm writes beside the database even when
/// it is only asked (a lock, SQLite's shared memory), which a verification must not, and on a
/// read-only volume cannot. As root it is given to the user that a program with reduced
/// rights runs as. Otherwise why there is none; an empty sentence when it was stopped.
[[nodiscard]] Result<TemporaryDirectory, Sentence> copyDatabase(const RootFiles& root,
                                                                const std::string& database,
                                                                const StopSwitch& stop);

/// Where a query of rpm(8) goes, and who hears of it.
struct RPMQuery {
    std::filesystem::path program;   ///< rpm, on this host
    std::filesystem::path database;  ///< absolute, as this host sees it
    OutputLimits limits;
    std::function<void(std::string)> trace;  ///< told the command; may be empty
};

/// What the packages of an RPM system say about their files, asked of this host's rpm. The
/// database is named in the command: on a system of another kind rpm's own is in a home
/// directory. Otherwise why it could not be asked; an empty sentence when it was stopped.
[[nodiscard]] Result<References, Sentence> readRPMReferences(const RootDirectory& root,
                                                             const Accounts& accounts,
                                                             const RPMQuery& query,
                                                             StopSwitch& stop);

}  // namespace pellar
