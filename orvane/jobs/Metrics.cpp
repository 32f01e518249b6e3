// SPDX-License-Identifier: Apache-2.0
#include "orvane/jobs/Metrics.h"

#include "contract/foundation/UTF8.h"
#include "contract/pellar/MessageKeys.h"

#include <fmt/format.h>

#include <array>
#include <chrono>
#include <set>
#include <utility>

namespace orvane {
namespace {

using pellar::Subject;

struct SubjectName {
    Subject subject;
    std::string_view name;
};
constexpr std::array subjects{SubjectName{Subject::Filesystem, "filesystem"},
                              SubjectName{Subject::PartitionMap, "partition_map"},
                              SubjectName{Subject::Permissions, "permissions"}};

const std::array verdicts{contract::kPLVerdictSound,    contract::kPLVerdictDamaged,
                          contract::kPLVerdictRepaired, contract::kPLVerdictInconclusive,
                          contract::kPLVerdictFailed,   contract::kPLVerdictStopped,
                          contract::kPLVerdictUndone};

/// One subject of one disk.
struct Measured {
    std::string labels;  ///< "device=…,uuid=…", without braces
    std::optional<LastRuns> runs;
    std::optional<Run::Time> skipped;
};

/// A family of series; a family stands in one piece.
class Family {
public:
    Family(std::string_view name, std::string_view help)
        : name_(name), text_(fmt::format("# HELP {0} {1}\n# TYPE {0} gauge\n", name, help))
    {
    }

    void add(const std::string& labels, const std::string& value)
    {
        text_ += fmt::format("{}{{{}}} {}\n", name_, labels, value);
        isEmpty_ = false;
    }
    std::string text() const { return isEmpty_ ? "" : text_; }

private:
    std::string_view name_;
    std::string text_;
    bool isEmpty_ = true;
};

// A value is UTF-8, with three characters escaped; one that is none would cost the collector the
// whole file.
std::string label(std::string_view name, std::string_view bytes)
{
    std::string value;
    contract::forEachCharacter(bytes, [&value](char32_t character) {
        if (character == '\n') {
            value += "\\n";
            return;
        }
        if (character == '\\' || character == '"')
            value += '\\';
        contract::appendUTF8(value, character);
    });
    return fmt::format("{}=\"{}\"", name, value);
}

std::string seconds(std::chrono::system_clock::duration duration)
{
    return fmt::format("{:.3f}", std::chrono::duration<double>(duration).count());
}

std::string seconds(Run::Time time)
{
    return seconds(time.time_since_epoch());
}

Subject subjectOf(const Run& run)
{
    const auto task = pellar::taskNamed(run.action);
    return task ? task->subject : Subject::Filesystem;
}

std::vector<Measured> measured(const std::vector<MeasuredDisk>& disks)
{
    std::vector<Measured> all;
    std::set<std::string> told;
    for (const MeasuredDisk& disk : disks)
        for (const auto& [subject, name] : subjects) {
            std::vector<Run> runs;
            for (const Run& run : disk.runs)
                if (!run.isGoingOn && subjectOf(run) == subject)
                    runs.push_back(run);
            Measured one{label("device", disk.device) + "," + label("uuid", disk.uuid) + "," +
                             label("label", disk.label) + "," + label("check", name),
                         lastRunsIn(runs),
                         subject == Subject::Filesystem ? disk.skipped : std::nullopt};
            // A series that is told twice costs the collector the whole file.
            if ((one.runs || one.skipped) && told.insert(one.labels).second)
                all.push_back(std::move(one));
        }
    return all;
}

void addVerdict(Family& family, const std::string& labels, const Run& run)
{
    for (const contract::Name& verdict : verdicts)
        family.add(labels + "," + label("verdict", verdict.text()),
                   run.end && run.end->verdict == verdict.text() ? "1" : "0");
}

}  // namespace

std::string expositionOf(const std::vector<MeasuredDisk>& disks, std::string_view version)
{
    Family build("fixwell_build_info", "The program that wrote this; always 1.");
    Family checked("fixwell_last_check_timestamp_seconds",
                   "When the last check that came to an answer began; where none did, the last.");
    Family attempted("fixwell_last_attempt_timestamp_seconds",
                     "When the last check began, whatever it came to.");
    Family skipped("fixwell_last_skipped_timestamp_seconds",
                   "When a scheduled check was last skipped, if none came after.");
    Family duration("fixwell_check_duration_seconds", "How long the last check took.");
    Family problems("fixwell_problems",
                    "How many problems the last check told of; 0 as well where that is not known.");
    Family verdict("fixwell_verdict", "1 for what the last check found, 0 for what it did not.");
    build.add(label("version", version), "1");
    for (const Measured& one : measured(disks)) {
        if (one.skipped)
            skipped.add(one.labels, seconds(*one.skipped));
        if (!one.runs)
            continue;
        const Run& told = one.runs->told;
        checked.add(one.labels, seconds(told.started));
        attempted.add(one.labels, seconds(one.runs->later.value_or(told).started));
        if (told.finished)
            duration.add(one.labels, seconds(*told.finished - told.started));
        problems.add(one.labels, std::to_string(told.end ? told.end->problems : 0));
        addVerdict(verdict, one.labels, told);
    }
    std::string text;
    for (const Family* const family :
         {&build, &checked, &attempted, &skipped, &duration, &problems, &verdict})
        text += family->text();
    return text;
}

}  // namespace orvane
