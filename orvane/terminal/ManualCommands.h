// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/disks/SystemDisks.h"
#include "orvane/terminal/CommandLine.h"
#include "orvane/terminal/TerminalLook.h"
#include "orvane/terminal/manual/Document.h"

#include <filesystem>
#include <optional>
#include <string>
#include <vector>

namespace orvane {

// The commands that tell of the program itself, and need no session. Each answers the exit status.

/// What the request wants to know, or a sentence with the topics that are near to one there is not.
/// `book` is the directory with the help's pages, by their languages.
[[nodiscard]] pellar::Result<manual::Document, std::string> helpPage(
    const Request& request, const std::filesystem::path& book, const Translator& texts);

/// To standard output; a sentence on standard error when not all of it can be written.
int writePage(const std::string& text, const Translator& texts);

int runHelp(const Request& request, const std::filesystem::path& book, const Translator& texts,
            const TerminalLook& look);

/// "--complete bash LINE REPLACED" or "--complete plain WORD...", which the shells' completions
/// run; none for any other command line.
std::optional<int> runCompletion(const std::vector<std::string>& arguments,
                                 const std::filesystem::path& book, const DiskSources& disks,
                                 const Translator& texts);

/// The program's version, and those of the checking tools in the directories of `toolPath`.
int runVersion(const std::string& toolPath, const Translator& texts, const TerminalLook& look);

}  // namespace orvane
