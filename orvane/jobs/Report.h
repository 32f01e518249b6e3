// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Array.h"
#include "orvane/support/SupportHost.h"

#include <cstddef>
#include <deque>
#include <filesystem>
#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace orvane {

/// A line of a report. All texts are fit to be shown: whatever stands on a disk, they hold neither
/// control characters nor line ends.
struct ReportLine {
    enum class Kind {
        Title,  ///< of the whole report
        Disk,   ///< the heading of a disk's chapter
        Run,    ///< the heading of a run: when it was, and its verdict
        Fact,   ///< a name and what is known by it
        Part,   ///< of a partition map
        Row,    ///< of the log
    };
    enum class Tone { Plain, Bad, Good };

    Kind kind = Kind::Row;
    std::string text;
    std::string name = {};  ///< of a fact
    Tone tone = Tone::Plain;
    bool isBold = false;  ///< of a row

    friend bool operator==(const ReportLine&, const ReportLine&) = default;
};

/// What of the histories a report tells.
struct ReportScope {
    bool isLastRunAlone = false;  ///< of each disk
    bool hasDetails = false;      ///< all rows of the log, not those alone that it shows in brief
};

/// The machine and its system: uname(2), os-release(5).
struct ComputerFacts {
    std::string kernel;
    std::string distribution;  ///< empty where it is not known
};
[[nodiscard]] ComputerFacts computerFacts(const std::vector<std::filesystem::path>& releaseFiles = {
                                              "/etc/os-release", "/usr/lib/os-release"});

/// What is known of disks, and what their histories tell, line by line, so that a long history can
/// be written bit by bit. It tells the histories as they were when it was made, as far as they are
/// not cleared meanwhile. Main thread.
class Report {
public:
    /// The host outlives the report. Of an image, what was found in it belongs to it; of a whole
    /// disk, its volumes.
    Report(const std::vector<std::shared_ptr<Disk>>& disks, SupportHost& host, ReportScope scope);
    Report(const Report&) = delete;
    Report& operator=(const Report&) = delete;

    /// None when that was all. Rows that are not told are passed over, so a call may take as long
    /// as those take to be looked at.
    [[nodiscard]] std::optional<ReportLine> next();
    /// From 0 to 1.
    [[nodiscard]] double progress() const;
    /// "Report on Letters, Photos"
    [[nodiscard]] const std::string& title() const { return title_; }

private:
    /// A disk with a history of its own.
    struct Chapter {
        std::shared_ptr<Disk> disk;
        std::vector<Run> runs;
        contract::Array records;
        std::size_t end = 0;   ///< of the records when the report was made
        std::size_t next = 0;  ///< record
        std::size_t nextRun = 0;
        bool isBegun = false;
    };

    void addChapters(const std::shared_ptr<Disk>& disk, ReportScope scope);
    void limitToLastRun(Chapter& chapter);
    void tellHead();
    void tellDisk(const Disk& disk);
    void tellParts(const Disk& disk);
    void tellRun(const Run& run);
    void tellRunsBefore(Chapter& chapter, RecordTimes::Time time);
    void tellRecord(Chapter& chapter);
    bool advance();

    void fact(std::string_view name, const std::string& text);
    void say(ReportLine line) { ready_.push_back(std::move(line)); }
    std::string sizeText(std::uint64_t bytes) const;
    std::string text(std::string_view key) const { return host_.translator().text(key); }

    SupportHost& host_;
    const bool hasDetails_;
    std::string title_;
    std::vector<Chapter> chapters_;
    std::size_t chapter_ = 0;
    std::size_t records_ = 0;  ///< of all chapters
    std::size_t told_ = 0;     ///< of these
    std::deque<ReportLine> ready_;
};

}  // namespace orvane
