// SPDX-License-Identifier: Apache-2.0
#include "pellar/tools/ext/E2fsckOutput.h"

#include <algorithm>
#include <array>
#include <charconv>

namespace pellar {
namespace {

using Kind = ToolLine::Kind;

struct Phase {
    std::string_view start;  ///< "Pass 1: "
    std::string_view key;
};

constexpr std::array phases{
    Phase{"Pass 1: ", "Checking inodes, blocks, and sizes"},
    Phase{"Pass 1B: ", "Rescanning for multiply-claimed blocks"},
    Phase{"Pass 1C: ", "Scanning directories for inodes with multiply-claimed blocks"},
    Phase{"Pass 1D: ", "Reconciling multiply-claimed blocks"},
    Phase{"Pass 1E: ", "Optimizing extent trees"},
    Phase{"Pass 2: ", "Checking directory structure"},
    Phase{"Pass 3: ", "Checking directory connectivity"},
    Phase{"Pass 3A: ", "Optimizing directories"},
    Phase{"Pass 4: ", "Checking reference counts"},
    Phase{"Pass 5: ", "Checking group summary information"},
};

/// The known phase that the line announces; none for any other line.
const Phase* phaseOf(std::string_view line)
{
    const auto found = std::find_if(phases.begin(), phases.end(), [line](const Phase& phase) {
        return line.starts_with(phase.start) && line.substr(phase.start.size()) == phase.key;
    });
    return found == phases.end() ? nullptr : &*found;
}

bool isDigit(char c)
{
    return c >= '0' && c <= '9';
}

bool takeNumber(std::string_view& text)
{
    const auto end = std::find_if_not(text.begin(), text.end(), isDigit);
    const auto length = static_cast<std::size_t>(end - text.begin());
    text.remove_prefix(length);
    return length > 0;
}

bool take(std::string_view& text, std::string_view start)
{
    if (!text.starts_with(start))
        return false;
    text.remove_prefix(start.size());
    return true;
}

/// What stands behind "NAME: ", where NAME is the volume's label, in which e2fsck has replaced
/// blanks and line ends, or the name that we gave it. Empty when there is no name.
std::string_view behindVolumeName(std::string_view line)
{
    const std::size_t end = line.find(' ');
    const bool isNamed = end != std::string_view::npos && end > 0 && line[end - 1] == ':';
    return isNamed ? line.substr(end + 1) : std::string_view();
}

/// "11/2048 files (9.1% non-contiguous), 1618/8192 blocks": the last line of a full run.
bool isTally(std::string_view text)
{
    return takeNumber(text) && take(text, "/") && takeNumber(text) && take(text, " files (") &&
           takeNumber(text) && take(text, ".") && takeNumber(text) &&
           take(text, "% non-contiguous), ") && takeNumber(text) && take(text, "/") &&
           takeNumber(text) && text == " blocks";
}

/// "Inode 12 extent tree (at level 1) could be narrower.  Fix? no": a saving that a repair would
/// make on a sound volume, and so no problem.
bool isSavingOnly(std::string_view text)
{
    return take(text, "Inode ") && takeNumber(text) && take(text, " extent tree (at level ") &&
           takeNumber(text) &&
           (text.starts_with(") could be narrower.") || text.starts_with(") could be shorter."));
}

/// "Free blocks count wrong (56023, counted=55588).": the sum that the superblock keeps of its
/// groups. While a volume is mounted nobody keeps it, and mounting it adds it up anew (ext4's
/// ext4_fill_super), so behind a journal that waited it is no problem.
bool isTotalOnly(std::string_view text)
{
    return text.starts_with("Free blocks count wrong (") ||
           text.starts_with("Free inodes count wrong (");
}

/// "11/2048 files": how many are in use.
std::optional<std::uint64_t> filesIn(std::string_view tally)
{
    std::uint64_t files = 0;
    const auto [end, error] = std::from_chars(tally.data(), tally.data() + tally.size(), files);
    return error == std::errc() ? std::optional(files) : std::nullopt;
}

/// What e2fsck or its library says where it could not read:
///     "Error reading block 357 (Input/output error).  Ignore error? no"
///     "Error while iterating over blocks in inode 7: Input/output error"
///     "NAME: Input/output error reading journal superblock"
///     "e2fsck: Input/output error while trying to open NAME"
/// or, in the first form, "(Attempt to read block from filesystem resulted in short read)". Names
/// of files stand in none of them.
std::optional<ReadFault> readFaultIn(std::string_view line)
{
    constexpr std::string_view inputError = "Input/output error";
    std::string_view rest = line;
    if (take(rest, "Error reading block ")) {
        ReadFault fault;
        std::uint64_t block = 0;
        const auto [end, error] = std::from_chars(rest.data(), rest.data() + rest.size(), block);
        if (error == std::errc())
            fault.block = block;
        fault.isUnproven = rest.find(inputError) == std::string_view::npos;
        return fault;
    }
    const bool isFault = behindVolumeName(line).starts_with(inputError) ||
                         (line.starts_with("Error while ") && line.ends_with(inputError));
    return isFault ? std::optional(ReadFault()) : std::nullopt;
}

/// "e2fsck 1.47.0 (5-Feb-2023)": the first line of every run.
bool isBanner(std::string_view text)
{
    return take(text, "e2fsck ") && takeNumber(text) && text.starts_with(".");
}

enum class Answer { None, Yes, No };

Answer answerOf(std::string_view line)
{
    if (line.ends_with("? yes"))
        return Answer::Yes;
    const bool isNo = line.ends_with("? no") || line.ends_with("IGNORED.");
    return isNo ? Answer::No : Answer::None;
}

/// Nothing but a question and its answer: "Fix? no", "Connect to /lost+found? yes". Where the
/// problem stands in the same line, its sentence ends before the question.
bool isBareAnswer(std::string_view line)
{
    return line.find(". ") == std::string_view::npos;
}

/// "Signal (11) SIGSEGV si_code=SEGV_MAPERR fault addr=0x8": e2fsck caught its own crash.
int crashSignalOf(std::string_view line)
{
    int signal = 0;
    if (take(line, "Signal ("))
        std::from_chars(line.data(), line.data() + line.size(), signal);
    return signal;
}

struct Sign {
    std::string_view text;
    Damage::Kind kind;
};

// The first that occurs in the line decides (e2fsck 1.47.0, the texts of its problem table).
constexpr std::array signs{
    Sign{"ultiply-claimed block", Damage::SharedBlocks},
    Sign{"uperblock", Damage::Structure},
    Sign{"super-block", Damage::Structure},
    Sign{"oot inode", Damage::Structure},
    Sign{"esize inode", Damage::Structure},
    Sign{"esize_inode", Damage::Structure},
    Sign{"ournal", Damage::Structure},
    Sign{"roup descriptor", Damage::Structure},
    Sign{"count wrong", Damage::Bookkeeping},
    Sign{"bitmap differences", Damage::Bookkeeping},
    Sign{"bitmap does not match checksum", Damage::Bookkeeping},
    Sign{"Padding at end of", Damage::Bookkeeping},
    Sign{", i_blocks is ", Damage::Bookkeeping},
    Sign{" ref count is ", Damage::Bookkeeping},
    Sign{"filetype", Damage::Bookkeeping},
    Sign{"Unattached", Damage::LostPlaces},
    Sign{"Unconnected directory", Damage::LostPlaces},
    Sign{"deleted/unused inode", Damage::LostPlaces},
    Sign{"lost+found", Damage::LostPlaces},
};

/// What e2fsck itself says. A file may be called "count wrong", so what stands before the number of
/// the directory is left out: "Entry 'NAME' in PATH (2) has deleted/unused inode 12."
std::string_view withoutNames(std::string_view problem)
{
    if (problem.find('\'') == std::string_view::npos)
        return problem;
    const std::size_t number = problem.rfind(") ");
    return number == std::string_view::npos ? std::string_view() : problem.substr(number);
}

}  // namespace

Damage e2fsckDamageOf(std::string_view problem)
{
    problem = withoutNames(problem);
    const auto found = std::find_if(signs.begin(), signs.end(), [problem](const Sign& sign) {
        return problem.find(sign.text) != std::string_view::npos;
    });
    return found == signs.end() ? Damage::Contents : found->kind;
}

void E2fsckOutput::read(std::string_view line, std::vector<ToolLine>& lines)
{
    if (line.find_first_not_of(" \t") == std::string_view::npos) {
        releaseKept(Kind::Detail, lines);
        return;
    }
    if (!findings_.readFault)
        findings_.readFault = readFaultIn(line);
    const Answer answer = answerOf(line);
    const bool isSecondQuestion = wasAnswered_ && kept_.empty() && isBareAnswer(line);
    wasAnswered_ = answer != Answer::None;
    if (answer == Answer::None && !readLandmark(line, lines))
        keepBack(line, lines);
    else if (answer != Answer::None && isSecondQuestion)
        lines.push_back({Kind::Detail, std::string(line), {}});
    else if (answer != Answer::None)
        readAnswer(line, answer == Answer::Yes, lines);
}

void E2fsckOutput::finish(std::vector<ToolLine>& lines)
{
    releaseKept(Kind::Detail, lines);
}

/// Lines that mean something of their own.
bool E2fsckOutput::readLandmark(std::string_view line, std::vector<ToolLine>& lines)
{
    const Phase* const phase = phaseOf(line);
    const bool isTrouble = readTrouble(line);
    if (phase == nullptr && !isTrouble && !readRemark(line))
        return false;
    releaseKept(Kind::Detail, lines);
    const Kind kind = phase != nullptr ? Kind::Phase : isTrouble ? Kind::Problem : Kind::Detail;
    lines.push_back({kind, std::string(line), phase == nullptr ? "" : phase->key});
    return true;
}

/// Shown as problems, but of the check; only a lost superblock is damage.
bool E2fsckOutput::readTrouble(std::string_view line)
{
    const int signal = crashSignalOf(line);
    const bool isInUse = line.ends_with(" is in use.") || line.ends_with(" is mounted.") ||
                         line.starts_with("e2fsck: MMP: ");
    const bool lacksJournal = line == "Can't find external journal";
    if (signal != 0)
        findings_.crashSignal = signal;
    findings_.foundDiskInUse = findings_.foundDiskInUse || isInUse;
    findings_.lacksExternalJournal = findings_.lacksExternalJournal || lacksJournal;
    // It asks nothing there, and ends with 0 although it writes.
    const bool isClearedJournal =
        line == "Found invalid V2 journal superblock fields (from V1 journal).";
    if (line.starts_with("e2fsck: Superblock invalid, ") || isClearedJournal) {
        ++findings_.problems;
        findings_.damage.add(Damage::Structure);
    }
    return signal != 0 || isClearedJournal || isInUse || lacksJournal ||
           line.starts_with("e2fsck: ") || line.starts_with("ext2fs_");
}

bool E2fsckOutput::readRemark(std::string_view line)
{
    const std::string_view named = behindVolumeName(line);
    if (isTally(named)) {
        findings_.isComplete = true;
        // It repeats what the volume's books say, which are wrong where anything is.
        if (findings_.problems == findings_.corrections)
            findings_.files = filesIn(named);
    } else if (named == "***** FILE SYSTEM WAS MODIFIED *****")
        findings_.wasModified = true;
    else if (line == "Clearing fields beyond the V1 journal superblock...")
        ++findings_.corrections;
    else if (named == "********** WARNING: Filesystem still has errors **********")
        findings_.hasErrorsLeft = true;
    else if (named == "recovering journal")
        findings_.replayedJournal = true;
    else if (line.starts_with("Warning: skipping journal recovery"))
        findings_.skippedJournal = true;
    else
        return isBanner(line);
    return true;
}

void E2fsckOutput::readAnswer(std::string_view line, bool isYes, std::vector<ToolLine>& lines)
{
    const bool hasItsText = !isBareAnswer(line) || kept_.empty();
    const std::string_view problem = hasItsText ? line : std::string_view(kept_.front());
    const bool isProblem =
        !isSavingOnly(line) && !(findings_.replayedJournal && isTotalOnly(problem));
    if (isProblem)
        findings_.damage.add(e2fsckDamageOf(problem));
    if (isYes)
        countLosses(problem, line);
    releaseKept(hasItsText || !isProblem ? Kind::Detail : Kind::Problem, lines);
    lines.push_back(
        {hasItsText && isProblem ? Kind::Problem : Kind::Detail, std::string(line), {}});
    findings_.problems += isProblem ? 1 : 0;
    findings_.corrections += isProblem && isYes ? 1 : 0;
}

/// "Connect to /lost+found? yes", "Clear inode? yes", "Clear? yes" of a file or a name.
void E2fsckOutput::countLosses(std::string_view problem, std::string_view answer)
{
    const bool isAboutFile = problem.starts_with("Inode ") || problem.starts_with("Entry ");
    const bool isCleared = answer.ends_with("Clear? yes") || answer.ends_with("Clear inode? yes");
    findings_.reconnected += answer.ends_with("Connect to /lost+found? yes") ? 1 : 0;
    findings_.cleared += isAboutFile && isCleared ? 1 : 0;
}

void E2fsckOutput::keepBack(std::string_view line, std::vector<ToolLine>& lines)
{
    constexpr std::size_t longestParagraph = 8;
    if (kept_.size() >= longestParagraph)
        releaseKept(Kind::Detail, lines);
    kept_.emplace_back(line);
}

void E2fsckOutput::releaseKept(Kind firstKind, std::vector<ToolLine>& lines)
{
    for (std::string& line : kept_)
        lines.push_back({&line == &kept_.front() ? firstKind : Kind::Detail, std::move(line), {}});
    kept_.clear();
}

std::optional<double> e2fsckPercent(std::string_view progressLine)
{
    // Where each of the five passes ends, in per cent of the whole.
    constexpr std::array<double, 6> ends{0, 70, 90, 92, 95, 100};
    std::array<std::uint64_t, 3> numbers{};  // pass, done, of
    const char* const end = progressLine.data() + progressLine.size();
    const char* start = progressLine.data();
    for (std::uint64_t& value : numbers) {
        const auto [next, error] = std::from_chars(start, end, value);
        if (error != std::errc() || (next != end && *next != ' '))
            return std::nullopt;
        start = next == end ? end : next + 1;
    }
    const auto [pass, done, of] = numbers;
    if (pass < 1 || pass > 5 || of == 0)
        return std::nullopt;
    const double share = std::min(1.0, static_cast<double>(done) / static_cast<double>(of));
    return ends[pass - 1] + (ends[pass] - ends[pass - 1]) * share;
}

}  // namespace pellar
