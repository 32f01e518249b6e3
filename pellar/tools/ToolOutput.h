// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/outcome/Damage.h"
#include "pellar/outcome/FileChange.h"

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace pellar {

/// One line of a tool, told apart.
struct ToolLine {
    enum class Kind {
        Phase,     ///< a new step begins
        Problem,   ///< something is wrong with the disk, or with the check
        Detail,    ///< anything else
        Progress,  ///< how far the run has come, and nothing to be shown as a line
    };

    Kind kind = Kind::Detail;
    std::string text;
    /// For a phase that is known: its English text, a literal.
    std::string_view phaseKey;
    double percent = 0;  ///< of a progress line, of this run

    friend bool operator==(const ToolLine&, const ToolLine&) = default;
};

/// The version number that stands in a line behind `banner`: letters, digits, dots, dashes; empty
/// where the line does not begin so, or `banner` is empty.
std::string_view versionBehind(std::string_view banner, std::string_view line);

/// What a tool could not read.
struct ReadFault {
    std::optional<std::uint64_t> byte;   ///< from the volume's start, where that is said
    std::optional<std::uint64_t> block;  ///< or this, of `VolumeFacts::blockBytes`
    /// It does not say whether the disk failed it or it looked in a wrong place; the kernel knows.
    bool isUnproven = false;

    friend bool operator==(const ReadFault&, const ReadFault&) = default;
};

/// What the lines of one run say together.
struct Findings {
    std::uint64_t problems = 0;     ///< problem lines
    Damage damage;                  ///< what they mean together
    std::uint64_t corrections = 0;  ///< of these, answered with yes
    bool isComplete = false;        ///< the line that ends a full run was printed
    bool wasModified = false;
    bool hasErrorsLeft = false;  ///< the tool says so itself
    bool skippedJournal = false;
    bool replayedJournal = false;
    bool lacksExternalJournal = false;
    bool lacksOtherDisk = false;  ///< a part of the volume is on a disk that was not found
    bool foundDiskInUse = false;
    bool expectsDifference = false;  ///< in what is no damage, and so no matter of its exit status
    int crashSignal = 0;             ///< caught by the tool itself; 0 for none
    std::optional<ReadFault> readFault;   ///< the first
    std::optional<std::uint64_t> files;   ///< that it counted, where it says so at its end
    std::vector<std::uint64_t> logParts;  ///< where the rest is of a log that it was to read
    std::uint64_t reconnected = 0;        ///< files that it gave a new name, as they had none
    std::uint64_t cleared = 0;            ///< files and names that it did away with
    std::vector<FileChange> changes;      ///< what it says of such files, as far as it names them

    friend bool operator==(const Findings&, const Findings&) = default;
};

/// Reads the lines of one run. Pure but for what it remembers of the lines before.
class OutputReader {
public:
    virtual ~OutputReader() = default;

    /// Appends what is known by now: none, one or several lines, in the tool's order.
    virtual void read(std::string_view line, std::vector<ToolLine>& lines) = 0;
    /// The run has ended.
    virtual void finish(std::vector<ToolLine>& lines) = 0;
    virtual const Findings& findings() const = 0;
};

/// For `Tool::makeReader`.
template <class Output>
std::unique_ptr<OutputReader> readerFor()
{
    return std::make_unique<Output>();
}

/// Reads a tool of which each line says by itself what it is. Empty lines are not passed on.
class LineOutput : public OutputReader {
public:
    void read(std::string_view line, std::vector<ToolLine>& lines) final;
    void finish(std::vector<ToolLine>&) final {}
    const Findings& findings() const final { return findings_; }

protected:
    /// Notes in `findings_` what the line says.
    virtual ToolLine tell(std::string_view line) = 0;

    static ToolLine detail(std::string_view line);
    static ToolLine phase(std::string_view line, std::string_view key);
    static ToolLine progress(double percent);
    ToolLine problem(std::string_view line, Damage damage);
    /// Kept unless there is one, or one that is less sure.
    void noteReadFault(const ReadFault& fault);
    /// Kept unless there are very many.
    void noteChange(FileChange change);

    Findings findings_;
};

/// A phase that a tool announces by a line of its own, or by how one begins.
struct PhaseSign {
    std::string_view start;
    std::string_view key;  ///< its English text, a literal
};

/// A sort of damage and the words by which a line tells of it.
struct DamageSign {
    std::string_view text;
    Damage::Kind kind;
};

/// The first sign whose start the line has; null for none.
template <class Signs>
const PhaseSign* phaseIn(const Signs& signs, std::string_view line)
{
    for (const PhaseSign& sign : signs)
        if (line.starts_with(sign.start))
            return &sign;
    return nullptr;
}

/// The first sign that occurs in the line; null for none.
template <class Signs>
const DamageSign* damageIn(const Signs& signs, std::string_view line)
{
    for (const DamageSign& sign : signs)
        if (line.find(sign.text) != std::string_view::npos)
            return &sign;
    return nullptr;
}

}  // namespace pellar
