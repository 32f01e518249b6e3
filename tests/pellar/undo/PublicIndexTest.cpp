// SPDX-License-Identifier: Apache-2.0
// What everybody may know of records that are their owner's alone.

#include "pellar/undo/PublicIndex.h"
#include "tests/pellar/undo/PowerCut.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

namespace pellar::test {
namespace {

namespace fs = std::filesystem;
using orvane::test::contentsOf;
using orvane::test::statusOfChild;
using orvane::test::TestDirectory;

constexpr auto today = std::chrono::system_clock::time_point(std::chrono::hours(480'000));
const std::string before(4096, 'b');
const std::string after(4096, 'a');

int noSync(int)
{
    return 0;
}

class PublicIndexTest : public testing::Test {
protected:
    UndoStore open(SyncFunction sync = noSync) const
    {
        return *UndoStore::open(records_, std::move(sync), index_);
    }
    static RecordedRepair repairOf(const fs::path& path)
    {
        return {{path, 512, 4096, "1234-ABCD", "vfat", "Geheim"},
                {Subject::Filesystem, Operation::Repair},
                1000,
                today};
    }
    UndoRecord save(const UndoStore& store, const fs::path& path = "/dev/sdb1")
    {
        CachedDisk view(after);
        return *store.save(repairOf(path), {{0, 512}, {1024, 1024}}, disk_, view);
    }
    /// "applying", "applied, in use", …; one word for each record.
    std::string index() const
    {
        const auto list = readPublicIndex(index_);
        if (!list)
            return "unreadable";
        std::string states = list->broken.empty() ? "" : "broken ";
        for (const ListedRecord& record : list->records) {
            constexpr std::array names{"applying", "applied", "undoing"};
            states += names.at(static_cast<std::size_t>(record.facts.state));
            states += record.isInUse ? "! " : " ";
        }
        return states;
    }

    TestDirectory directory_;
    const fs::path records_ = directory_ / "system/repairs/records";
    const fs::path index_ = directory_ / "system/repairs/index";
    CachedDisk disk_{before};
};

TEST_F(PublicIndexTest, EverybodyReadsTheFactsAndNothingElse)
{
    fs::create_directories(records_);  // as they were made before there was an index
    for (fs::path way = records_; way != directory_.path(); way = way.parent_path())
        ::chmod(way.c_str(), 0700);
    ::chmod(directory_.path().c_str(), 0711);
    const UndoStore store = open();
    std::string id;
    {
        UndoRecord record = save(store);
        id = record.id();
        EXPECT_TRUE(record.apply(disk_));
    }
    if (::geteuid() != 0)
        GTEST_SKIP() << "becoming another user needs root";
    EXPECT_EQ(statusOfChild([&] {
                  static_cast<void>(!::setresgid(65534, 65534, 65534) &&
                                    !::setresuid(65534, 65534, 65534));
                  const auto list = readPublicIndex(index_);
                  if (!list || list->records.size() != 1)
                      return 1;
                  RecordedRepair known = repairOf("/dev/sdb1");
                  known.disk.name = "";
                  const RecordFacts& facts = list->records.front().facts;
                  if (facts.repair != known || facts.state != RecordState::Applied ||
                      facts.rangeCount != 2 || facts.changedBytes != 1536)
                      return 2;
                  if (!facts.beforeDigest.empty() || !facts.afterDigest.empty() ||
                      !facts.rangesDigest.empty())
                      return 3;
                  if (::access((records_ / id).c_str(), F_OK) == 0 ||
                      ::open((index_ / id).c_str(), O_RDWR) >= 0 ||
                      ::open(index_.parent_path().c_str(), O_RDONLY) >= 0 ||
                      ::mkdir((index_ / "x").c_str(), 0700) == 0)
                      return 4;
                  return 0;
              }) >>
                  8,
              0);
}

TEST_F(PublicIndexTest, FollowsARecordFromItsBeginningToItsEnd)
{
    const UndoStore store = open();
    {
        UndoRecord record = save(store);
        EXPECT_EQ(index(), "") << "the disk has not been touched";
        disk_.happened = [&, isFirst = true]() mutable {
            if (std::exchange(isFirst, false)) {
                EXPECT_EQ(index(), "applying! ");
            }
        };
        disk_.failingFrom = 2;
        EXPECT_FALSE(record.apply(disk_));
    }
    disk_.happened = [] {
    };
    disk_.failingFrom = 1 << 30;
    EXPECT_EQ(index(), "applying ") << "interrupted";
    const std::string id = store.list().records.front().id;
    EXPECT_TRUE(store.take(id)->finish(disk_));
    EXPECT_EQ(index(), "applied ");
    {
        UndoRecord record = *store.take(id);
        EXPECT_TRUE(record.undo(disk_));
        EXPECT_EQ(index(), "");
    }
    EXPECT_TRUE(save(store).apply(disk_));
    EXPECT_TRUE(save(store, "/home/somebody/secret.img").apply(disk_)) << "images are not told of";
    EXPECT_EQ(index(), "applied ");
    EXPECT_EQ(store.removeBeyond({0, {}, 0}, today), 2U);
    EXPECT_EQ(index(), "");
}

// Before each sync and after it; what everybody reads then may be graver than the truth, and is the
// truth once the owner has looked.
TEST_F(PublicIndexTest, AKillAtAnyMomentLeavesWhatTheNextListingMends)
{
    constexpr int atEnd = 99;
    const auto killedAt = [this](int count, const std::function<void(UndoStore&)>& work) {
        return statusOfChild([&] {
                   UndoStore store = open([&count](int) {
                       if (count-- == 0)
                           ::_exit(0);
                       return 0;
                   });
                   work(store);
                   return atEnd;
               }) >>
               8;
    };
    const auto apply = [this](UndoStore& store) {
        static_cast<void>(save(store).apply(disk_));
    };
    const auto undo = [this](UndoStore& store) {
        CachedDisk repaired(before);
        repaired.cached.replace(0, 512, after, 0, 512).replace(1024, 1024, after, 0, 1024);
        static_cast<void>(store.take(store.list().records.front().id)->undo(repaired));
    };
    for (const bool isUndo : {false, true}) {
        int kills = 0;
        for (bool isOver = false; !isOver; ++kills) {
            fs::remove_all(directory_ / "system");
            if (isUndo) {
                ASSERT_EQ(killedAt(-1, apply), atEnd);
            }
            isOver = killedAt(kills, isUndo ? std::function(undo) : apply) == atEnd;
            const std::string seen = index();
            std::string truth;
            for (const ListedRecord& record : open().list().records)
                truth += record.facts.state == RecordState::Applied    ? "applied "
                         : record.facts.state == RecordState::Applying ? "applying "
                                                                       : "undoing ";
            EXPECT_EQ(index(), truth) << kills;
            const bool isInterrupted = truth == "applying " || truth == "undoing ";
            EXPECT_TRUE(seen == truth || !isInterrupted) << kills << seen << truth;
            EXPECT_EQ(seen.find("broken"), std::string::npos);
        }
        EXPECT_GT(kills, 8);
    }
}

TEST_F(PublicIndexTest, WithoutAnIndexNothingIsSavedAndAllCanBeUndone)
{
    EXPECT_TRUE(save(*UndoStore::open(records_, noSync)).apply(disk_));
    orvane::test::write(index_, "no directory");
    const UndoStore store = open();
    CachedDisk view(after);
    EXPECT_FALSE(store.save(repairOf("/dev/sdb1"), {{0, 512}}, disk_, view));
    EXPECT_TRUE(store.take(store.list().records.front().id)->undo(disk_));
    EXPECT_EQ(disk_.medium, before);
}

TEST_F(PublicIndexTest, WhatOthersCouldHaveWrittenIsNotBelieved)
{
    EXPECT_EQ(index(), "") << "there is none";
    const UndoStore store = open();
    EXPECT_TRUE(save(store).apply(disk_));
    const fs::path entry = index_ / store.list().records.front().id;
    const std::string good = contentsOf(entry);
    const auto puts = [&](const std::function<void()>& change) {
        fs::remove_all(entry);
        orvane::test::write(entry, good);
        change();
        const std::string seen = index();
        static_cast<void>(store.list());
        EXPECT_EQ(index(), "applied ") << "the owner's next look mends it";
        return seen;
    };
    EXPECT_EQ(puts([] {}), "applied ");
    EXPECT_EQ(puts([&] { ::chmod(entry.c_str(), 0666); }), "broken ");
    EXPECT_EQ(puts([&] { fs::resize_file(entry, 40); }), "broken ");
    EXPECT_EQ(puts([&] { fs::resize_file(entry, largestFacts + 1); }), "broken ");
    EXPECT_EQ(puts([&] {
                  fs::rename(entry, directory_ / "elsewhere");
                  fs::create_symlink(directory_ / "elsewhere", entry);
              }),
              "broken ");
    EXPECT_EQ(puts([&] {
                  fs::remove(entry);
                  ::mkfifo(entry.c_str(), 0644);
              }),
              "broken ");
    orvane::test::write(index_ / "20240101T000000Z-001", good);
    static_cast<void>(store.list());
    EXPECT_EQ(index(), "applied ") << "what has no record goes";
    ::chmod(index_.c_str(), 0777);
    EXPECT_EQ(index(), "unreadable");
}

}  // namespace
}  // namespace pellar::test
