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
    /// The store must outlive this object.
    explicit DiskHistories(HistoryStore& store) : store_(store) {}

    /// From now on long histories come in two steps. `isIncomplete` is called when one has begun
    /// to; the caller must then call `loadMore` until it answers NO.
    void loadGradually(std::function<void()> isIncomplete)
    {
        isIncomplete_ = std::move(isIncomplete);
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
    /// YES also where there were runs without records.
    bool clearHistoryOf(const DiskFacts& disk) override;
    std::uint64_t revision() const override { return revision_; }

    /// Saves every record that is not in the store yet. A front end calls it right before it shows
    /// rows: what the user has seen is then kept, whatever happens to the program. Costs next to
    /// nothing when there is nothing new. What cannot be saved now is tried again the next time.
    void saveNew();

    /// From now on what is cleared is remembered, and can be brought back until this object goes.
    void rememberCleared() { remembersCleared_ = true; }
    /// What is cleared from now on is brought back by itself: the user has done something else.
    void closeClearing() { ++clearing_; }
    bool hasCleared() const { return !cleared_.empty(); }
    /// Brings back the histories that were cleared together last, in front of what has come since.
    /// The lists are others now.
    void restoreCleared();

    /// What the disk's runs and records are filed under; the same for as long as the program runs.
    std::string keyOf(const DiskFacts& disk);

private:
    /// The records before those that are in the list already.
    struct Older {
        contract::Array records;
        RecordTimes times;
        RecordRange left;
    };

    struct History {
        contract::Array records;
        RecordTimes times;
        std::size_t savedCount = 0;
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

    HistoryStore& store_;
    std::map<std::string, History> histories_;               ///< by key
    std::map<std::string, std::string> identifiersOfUUIDs_;  ///< of the first disk that had it
    std::function<void()> isIncomplete_;
    bool remembersCleared_ = false;
    std::vector<Cleared> cleared_;  ///< the last one at the end
    std::uint64_t clearing_ = 0;    ///< which of them belong together
    std::uint64_t revision_ = 1;
    std::uint64_t generation_ = 0;
};

}  // namespace orvane
