// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/disks/HistoryKeeper.h"
#include "orvane/support/history/HistoryStore.h"

#include <map>
#include <string>

namespace orvane {

/// The histories in memory: each is read from the store when it is first asked for, and lives
/// until the program ends, so that a disk that goes and comes again finds its records. Main thread
/// only.
class DiskHistories final : public HistoryKeeper {
public:
    /// The store must outlive this object.
    explicit DiskHistories(HistoryStore& store) : store_(store) {}

    fixwell::Array historyOf(const DiskFacts& disk) override;
    void replaceHistoryOf(const DiskFacts& disk, const fixwell::Array& history) override;
    bool clearHistoryOf(const DiskFacts& disk) override;

    /// Saves every record that is not in the store yet. A front end calls it right before it shows
    /// rows: what the user has seen is then kept, whatever happens to the program. Costs next to
    /// nothing when there is nothing new. What cannot be saved now is tried again the next time.
    void saveNew();

    /// What the disk's runs and records are filed under; the same for as long as the program runs.
    std::string keyOf(const DiskFacts& disk);

private:
    struct History {
        fixwell::Array records;
        std::size_t savedCount = 0;
        fixwell::Value lastSaved;
    };

    History& find(const DiskFacts& disk);
    void save(const std::string& key, History& history);
    static bool hasOnlyGrown(const History& history);

    HistoryStore& store_;
    std::map<std::string, History> histories_;               ///< by key
    std::map<std::string, std::string> identifiersOfUUIDs_;  ///< of the first disk that had it
    std::uint64_t generation_ = 0;
};

}  // namespace orvane
