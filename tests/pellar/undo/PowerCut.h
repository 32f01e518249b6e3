// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/process/FileDescriptor.h"
#include "pellar/undo/UndoStore.h"
#include "tests/support/TestDirectory.h"

#include <cstdint>
#include <functional>
#include <map>
#include <optional>
#include <random>
#include <set>
#include <string>
#include <utility>
#include <vector>

namespace pellar::test {

/// A disk in memory with a write cache: what was not synced may be lost, or there in part.
class CachedDisk final : public Region {
public:
    explicit CachedDisk(std::string bytes) : medium(bytes), cached(std::move(bytes)) {}

    std::uint64_t length() const override { return cached.size(); }
    int read(std::uint64_t place, std::span<std::uint8_t> bytes) override;
    int write(std::uint64_t place, ByteView bytes) override;
    int sync() override;
    void forgetCached() override {}

    std::string medium;
    std::string cached;
    std::vector<std::pair<std::uint64_t, std::string>> pending;
    std::function<void()> happened = [] {
    };

    // Faults. Writes are counted from 1.
    int writes = 0;
    std::set<int> failingWrites;
    int failingFrom = 1 << 30;              ///< all writes from this one on
    std::optional<std::uint64_t> badPlace;  ///< no write that begins there succeeds
    int lostWrite = 0;                      ///< told to be written, and is not
    int failingSyncs = 0;
    int failingReadsFrom = 1 << 30;
    int reads = 0;
};

/// What is there after a power cut.
struct Remains {
    std::map<std::string, std::map<std::string, std::string>> store;  ///< by directory and file
    std::string disk;
};

/// Watches a store's syncs and a disk's writes and syncs, and keeps at each of them what a power
/// cut could leave: nothing that was not synced, all of it, and some of it by chance. The names in
/// a directory are safe when the directory was synced, a file's bytes when the file was.
class PowerCuts {
public:
    PowerCuts(const std::filesystem::path& store, CachedDisk& disk);

    SyncFunction syncFunction();
    void happened();

    std::vector<Remains> remains;

private:
    struct Files {
        std::map<std::filesystem::path, ino_t> names;
        std::map<ino_t, std::string> bytes;
    };
    /// Whether something that was not synced is there.
    using Chance = std::function<bool()>;

    Files look();
    void synced(int descriptor);
    Remains cut(const Files& now, const Chance& isThere);
    std::string cutDisk(const Chance& isThere);

    std::filesystem::path store_;
    CachedDisk& disk_;
    Files safe_;
    std::map<ino_t, FileDescriptor> kept_;  // so that no number is used twice
    std::mt19937 random_{1};
};

/// Makes the files of a store anew.
void putStore(const Remains& remains, const std::filesystem::path& store);

}  // namespace pellar::test
