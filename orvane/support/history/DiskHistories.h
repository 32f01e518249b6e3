// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/disks/DiskFacts.h"
#include "orvane/support/disks/DiskHistory.h"
#include "orvane/support/history/HistoryStore.h"

#include <functional>
#include <map>
#include <optional>
#include <string>

namespace orvane {

/// What is known of the run that begins with a record of a log.
struct RunOfRecord {
    RecordTimes::Time time;  ///< at which the record was saved, which is before the run began
    /// None where none began after all, or it is not kept any more.
    std::optional<Run> run;
};

/// The records of one history with which runs begin, and when each was saved.
class RunStarts {
public:
    struct Start {
        contract::Dictionary record;
        RecordTimes::Time time;
    };

    /// Looks at those of the records that have a time, and were not looked at yet.
    void take(const contract::Array& records, const RecordTimes& times);
    /// Of the records in front of those that were looked at.
    void insertInFront(const RunStarts& older);
    const std::vector<Start>& list() const { return list_; }

private:
    std::vector<Start> list_;
    std::size_t taken_ = 0;
};

/// The run that was begun with the start at `index`: a record is saved before its run begins, and
/// the next one behind it. None where none was.
[[nodiscard]] std::optional<Run> runBegunAt(const std::vector<RunStarts::Start>& starts,
                                            std::size_t index, const std::vector<Run>& runs);

/// What a volume's history is filed under.
///
/// A file system on a device is known by its UUID, because device names change from one start to
/// the next. Copies of a device have the same UUID, so while two are known at one time,
/// `sharesUUID` tells them apart by their identifiers. An image file is known by its path as well
/// as by its UUID: copies of images are everyday things, and they are not checked at one time.
/// What has no UUID is known by its identifier.
[[nodiscard]] std::string historyKeyOf(const DiskFacts& disk, bool sharesUUID);

/// The histories in memory: each is read from the store when it is first asked for, and lives
/// until the program ends, so that a disk that goes and comes again finds its records. Main thread
/// only.
///
/// A long history may come in two steps, so that no caller waits for its oldest records: at first
/// the newest ones alone, and the complete list when `loadMore` has read the others.
class DiskHistories final : public HistoryKeeper {
public:
    /// A few milliseconds' worth; more than fits into a window.
    static constexpr std::int64_t recordsAtOnce = 4000;

    /// The store must outlive this object.
    explicit DiskHistories(HistoryStore& store) : store_(store) {}

    /// From now on histories of more than `newest` records come in two steps. `isIncomplete` is
    /// called when one has begun to; the caller must then call `loadMore` until there is nothing
    /// more, or do without the older ones.
    void loadGradually(std::function<void()> isIncomplete, std::int64_t newest = recordsAtOnce)
    {
        isIncomplete_ = std::move(isIncomplete);
        newestRecords_ = newest;
    }
    enum class Progress { Nothing, More, Completed };
    /// Reads for a few milliseconds. `Completed`: one of the lists is another now, and there may
    /// be more to do.
    Progress loadMore();
    /// Returns when every list is complete. NO when all were.
    bool loadAll();

    contract::Array historyOf(const DiskFacts& disk) override;
    const RecordTimes& timesOf(const DiskFacts& disk) override;
    void replaceHistoryOf(const DiskFacts& disk, const contract::Array& history) override;
    /// Of a record that `isStartOfRun`; none before it was saved. Quick for records of one history
    /// that are asked for in their order, or against it.
    std::optional<RunOfRecord> runOf(const contract::Dictionary& start);
    /// No run of its history began later.
    bool isNewestStart(const contract::Dictionary& start) const;

    /// YES also where there were runs without records.
    bool clearHistoryOf(const DiskFacts& disk) override;
    std::uint64_t revision() const override { return revision_; }

    /// Saves every record that is not in the store yet. A front end calls it right before it shows
    /// rows: what the user has seen is then kept, whatever happens to the program. Costs next to
    /// nothing when there is nothing new. What cannot be saved now is tried again the next time.
    void saveNew();

    /// Reads the histories anew to which another program has appended, or that it has cleared; YES
    /// when there was one. The lists are others then.
    bool takeInOthers();

    /// From now on what is cleared is remembered, and can be brought back until this object goes.
    void rememberCleared() { remembersCleared_ = true; }
    /// What is cleared from now on is brought back by itself: the user has done something else.
    void closeClearing() { ++clearing_; }
    bool hasCleared() const { return !cleared_.empty(); }
    /// Brings back the histories that were cleared together last, in front of what has come since.
    /// The lists are others now.
    void restoreCleared();

    /// The identifiers of the devices that are there with a UUID, in an order that every program
    /// gives them.
    using Devices = std::function<std::vector<std::string>(const std::string& uuid)>;
    /// Who can tell it, so that copies of a device are told apart alike by every program, whichever
    /// of them it is asked about.
    void askForDevices(Devices devices) { devices_ = std::move(devices); }
    /// What the disk's runs and records are filed under; the same for as long as the program runs.
    std::string keyOf(const DiskFacts& disk);

private:
    /// The records before those that are in the list already.
    struct Older {
        contract::Array records;
        RecordTimes times;
        RecordRange left;
        RunStarts starts = {};
    };

    struct History {
        contract::Array records;
        RecordTimes times;
        RunStarts starts;
        std::size_t savedCount = 0;
        std::int64_t endInStore = 0;  ///< of the volume's records there, as far as they are known
        contract::Value lastSaved;
        std::optional<Older> older = std::nullopt;
    };

    struct Cleared {
        std::string key;
        contract::Array records;
        RecordTimes times;
        std::vector<Run> runs;
        std::uint64_t clearing;
    };

    void remember(const std::string& key, History& history, std::vector<Run> runs);
    void restore(const Cleared& cleared);
    History& find(const DiskFacts& disk);
    History load(const std::string& key);
    static void complete(History& history);
    void save(const std::string& key, History& history, RecordTimes::Time now);
    static bool hasOnlyGrown(const History& history);

    /// The runs of a volume as they stand in the store.
    struct KnownRuns {
        std::vector<Run> runs;
        std::uint64_t revision = 0;
    };
    const std::vector<Run>& runsOf(const std::string& key);
    std::optional<std::size_t> placeOf(const contract::Dictionary& start, const std::string& key);

    HistoryStore& store_;
    std::map<std::string, KnownRuns> knownRuns_;
    std::string lastKey_;  ///< where `runOf` found something last
    std::size_t lastPlace_ = 0;
    std::map<std::string, History> histories_;               ///< by key
    std::map<std::string, std::string> identifiersOfUUIDs_;  ///< of the first device that has it
    Devices devices_;
    std::function<void()> isIncomplete_;
    std::int64_t newestRecords_ = recordsAtOnce;
    bool remembersCleared_ = false;
    std::vector<Cleared> cleared_;  ///< the last one at the end
    std::uint64_t clearing_ = 0;    ///< which of them belong together
    std::uint64_t revision_ = 1;
    std::uint64_t generation_ = 0;
};

}  // namespace orvane
