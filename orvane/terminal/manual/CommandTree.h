// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/texts/Catalogue.h"
#include "orvane/terminal/manual/Document.h"

#include <string>
#include <string_view>
#include <vector>

namespace orvane::manual {

/// An option of a command, or of all of them.
struct OptionEntry {
    std::string name;            ///< "--details"
    std::string shortName = {};  ///< "-h"; mostly empty
    std::string value;  ///< what it takes: choices ("auto|never"), or a name (FILE); empty: nothing
    std::string text;

    /// "--color auto|never", in the language of the texts.
    std::string usage(const Translator& texts) const;
};

/// What a command takes besides options.
struct ArgumentEntry {
    std::string name;  ///< DISK, IMAGE, TOPIC
    std::string text;
    bool isRequired = false;
    bool isMany = false;
};

struct CommandEntry {
    std::string name;
    std::string text;
    std::vector<ArgumentEntry> arguments;
    std::vector<OptionEntry> options;  ///< its own

    /// "repair [OPTION...] DISK...", in the language of the texts.
    std::string usage(const Translator& texts) const;
};

/// The command line as its parser has it, in one language: what help, the manual and completions
/// are made of.
struct CommandTree {
    std::string name;
    std::string text;
    std::vector<CommandEntry> commands;
    std::vector<OptionEntry> options;  ///< that every command takes
    std::string footer;

    /// None when there is no such command.
    const CommandEntry* find(std::string_view command) const;
};

/// The choices of "auto|never"; none of a name.
std::vector<std::string> choicesOf(std::string_view value);

/// "fixwell --help".
Document overviewOf(const CommandTree& tree, const Translator& texts);
/// "fixwell help COMMAND".
Document helpOn(const CommandEntry& command, const CommandTree& tree, const Translator& texts);
/// A row for each: its usage and its text.
std::vector<Block> rowsOf(const std::vector<OptionEntry>& options, const Translator& texts);

/// Those of `known` that the word may have been meant to be, the nearest first; none that is far
/// off.
std::vector<std::string> nearest(std::string_view word, const std::vector<std::string>& known);

}  // namespace orvane::manual
