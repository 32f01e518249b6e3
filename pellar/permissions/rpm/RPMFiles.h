// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/permissions/Accounts.h"
#include "pellar/permissions/PathAliases.h"
#include "pellar/permissions/Reference.h"

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

}  // namespace pellar
