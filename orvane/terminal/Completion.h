// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/disks/SystemDisks.h"
#include "orvane/terminal/manual/CommandTree.h"

#include <functional>
#include <string>
#include <string_view>
#include <vector>

namespace orvane {

/// What may stand where the user is writing.
struct Candidate {
    std::string value;      ///< the whole word, as the program takes it: any bytes but NUL
    std::string text = {};  ///< what it is; printable

    friend bool operator==(const Candidate&, const Candidate&) = default;
};

struct Offer {
    std::vector<Candidate> candidates;
    bool takesFiles = false;  ///< names of files may stand there, too
};

/// What completions are made from; each is asked when it is needed.
struct CompletionSources {
    manual::CommandTree tree;
    std::function<std::vector<DiskTree>()> disks;
    std::function<std::vector<Candidate>()> topics;  ///< of the help, besides commands
};

/// For the last of the words behind the program's name, which may be empty; it may hold less or
/// more than what is offered begins with. A label that two disks have is not offered.
Offer offerFor(const std::vector<std::string>& words, const CompletionSources& sources);

/// A shell's line that ends where the cursor stands, taken apart without doing anything that it
/// says.
struct ShellLine {
    enum class Quote { None, Single, Double, Dollar };  ///< Dollar: $'…'
    std::vector<std::string> words;  ///< as the program would get them; the last may be empty
    std::string rest;                ///< the last as it is written
    Quote quote = Quote::None;       ///< that is still open
    bool isExpanded = false;         ///< the shell would put something else into the last word
};
ShellLine readShellLine(std::string_view line);

/// `text` as it has to be written after an opened quote of this kind, so that bash(1) takes it
/// literally, in letters that do nothing to a terminal.
std::string bashText(std::string_view text, ShellLine::Quote quote);

/// For bash's completion function: a line of flags ("nospace", "files" or both), and a line for
/// each text that may take the place of `replaced`, which is the end of `line` as readline sees
/// words.
std::string bashReply(std::string_view line, std::string_view replaced,
                      const CompletionSources& sources);

/// For shells that quote by themselves: "files" or "words", then value and text of each candidate,
/// every one ended by NUL.
std::string plainReply(const std::vector<std::string>& words, const CompletionSources& sources);

}  // namespace orvane
