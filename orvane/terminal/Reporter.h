// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Dictionary.h"
#include "contract/foundation/StyledText.h"
#include "contract/pellar/ErrorCodes.h"

#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace orvane {

/// Whether an action can be used on a disk, and the module's reason where it cannot.
struct ActionLine {
    std::string command;  ///< as the command line names it
    std::string title;
    bool isAvailable = false;
    std::string reason;
};

/// One disk, volume or image of `fixwell list`.
struct DiskLine {
    std::string disk;  ///< what a command takes
    std::string name;
    std::string kind;
    std::string filesystem;  ///< as programs name it
    std::string format;      ///< the same as people do
    std::uint64_t bytes = 0;
    std::string mountPoint;
    bool isVolume = false;
    std::string lastChecked;  ///< local time; empty when never
    std::string verdict;
    /// A later check that came to no answer (it was stopped, or failed); mostly none.
    struct Attempt {
        std::string started;  ///< local time
        std::string verdict;  ///< empty when it was cut off
    };
    std::optional<Attempt> later = {};
    std::string nextCheck = {};  ///< local time of the scheduled one; empty where none is known
    /// The record of a repair that was interrupted as it was written; empty: none that is known.
    std::string interruptedRepair = {};
    bool isOthersToUndo = false;  ///< another user asked for that repair
    std::vector<ActionLine> actions;
};

/// One earlier check of `fixwell history`.
struct RunLine {
    std::string started;  ///< local time
    std::string action;
    std::string verdict;  ///< empty for a run that was cut off with the program
    std::string message;
    std::string record =
        {};  ///< of what the repair overwrote, where it can be undone; mostly empty
};

/// What a module shows of the selected disks.
struct ModuleView {
    std::string module;  ///< its name, as the command line takes it
    std::string title;
    std::vector<std::pair<std::string, std::string>> texts;  ///< by the names of its controls
    std::vector<ActionLine> buttons;                         ///< what --press takes
};

/// One module of `fixwell modules`.
struct ModuleLine {
    std::string name;
    std::string path;
    std::string refusal;  ///< why it cannot be used; empty when it can
};

/// What the user called each disk. A volume inside an image is called by the image's name and
/// its number: "backup.img#2".
class GivenNames {
public:
    void add(const std::string& identifier, const std::string& name) { names_[identifier] = name; }

    /// The identifier itself for a disk that was not named.
    std::string nameOf(std::string_view identifier) const;

    /// What the user named: the disk, or what it lies inside of.
    std::string namedOf(std::string_view identifier) const;

    /// Whether the disk is the named one, or lies inside it.
    static bool isWithin(std::string_view identifier, std::string_view named);

private:
    std::map<std::string, std::string, std::less<>> names_;
};

/// How the program speaks: to people, or to other programs. `disk` is always what the user
/// named, or that and the volume's number.
class Reporter {
public:
    virtual ~Reporter() = default;

    virtual void started(const std::string& disk, std::string_view action,
                         const std::string& title) = 0;
    /// A row of the log, with its text as the log view's cell holds it.
    virtual void record(const std::string& disk, const contract::Dictionary& record,
                        const contract::StyledText& text) = 0;
    /// The rows that were waiting are written; a reader should see them now.
    virtual void rowsWritten() = 0;
    /// No percentage while there is no telling.
    virtual void progress(const std::string& disk, std::optional<double> percent,
                          const std::string& status) = 0;
    virtual void finished(const std::string& disk, std::string_view verdict,
                          contract::ErrorCode error, std::string_view message) = 0;
    /// What the module reports of a finished queue.
    virtual void report(const std::string& /*disk*/, const contract::Dictionary& /*report*/) {}
    /// A password agent asks on the terminal, and nothing is drawn until it is over. `Left`: the
    /// prompt was left with Ctrl-C, in the middle of its line.
    enum class Prompt { Open, Left, Over };
    virtual void prompt(Prompt /*state*/) {}
    virtual void alert(const std::string& title, const std::string& message) = 0;
    /// Something that went wrong outside of a job: one sentence.
    virtual void failure(const std::string& disk, const std::string& sentence) = 0;
    /// What the program goes on without, or a line of its trace.
    virtual void warning(const std::string& sentence) = 0;
    virtual void listed(const DiskLine& disk) = 0;
    /// Something that is no job was done: one sentence. `place` is the device or the mount point
    /// that came of it, or empty.
    virtual void done(const std::string& disk, std::string_view action, const std::string& place,
                      const std::string& sentence) = 0;
    virtual void shown(const ModuleView& view) = 0;
    virtual void found(const ModuleLine& module) = 0;
    /// All runs of a disk, oldest first; its records follow.
    virtual void runs(const std::string& disk, const std::vector<RunLine>& runs) = 0;
    /// The last call. NO when some of the output could not be written.
    [[nodiscard]] virtual bool end();

    /// "fixwell: SENTENCE" on standard error, made printable.
    static void writeError(const std::string& sentence);

protected:
    /// Hands what is buffered to the system, after every burst: a reader sees it at once.
    void flush();

private:
    bool hasLostOutput_ = false;
};

struct TextReporterOptions {
    bool colors = false;
    bool showsProgress = false;
    /// A text of the host's own in the user's language.
    std::function<std::string(std::string_view key)> translate;
};

/// Speaks to people: rows as they come, and on a terminal one live line at the bottom.
[[nodiscard]] std::unique_ptr<Reporter> makeTextReporter(TextReporterOptions options);

/// Speaks to other programs: one JSON object (RFC 8259) per line of standard output, each with an
/// "event". Bytes that are no UTF-8 become U+FFFD.
[[nodiscard]] std::unique_ptr<Reporter> makeJSONReporter();

}  // namespace orvane
