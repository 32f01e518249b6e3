// SPDX-License-Identifier: Apache-2.0
#include "pellar/undo/UndoStore.h"
#include "tests/pellar/undo/PowerCut.h"

#include <gtest/gtest.h>

#include <fcntl.h>
#include <signal.h>
#include <sys/resource.h>
#include <sys/stat.h>

#include <optional>

namespace pellar::test {
namespace {

namespace fs = std::filesystem;
using namespace std::chrono_literals;
using orvane::test::contentsOf;
using orvane::test::TestDirectory;
using Left = UndoFailure::Left;

constexpr auto today = std::chrono::system_clock::time_point(20000 * 24h);
const std::vector<ByteRange> ranges{{0, 512}, {1024, 3000}, {4096, 1}, {5000, 1192}};

int noSync(int)
{
    return 0;
}

std::string oldDisk(std::size_t size = 6192)
{
    std::string bytes(size, '\0');
    for (std::size_t i = 0; i < size; ++i)
        bytes[i] = static_cast<char>('a' + i * 7 % 23);
    return bytes;
}

std::string repaired(std::string bytes, const std::vector<ByteRange>& changed = ranges)
{
    for (const ByteRange& range : changed)
        for (std::uint64_t i = range.offset; i < range.offset + range.length; ++i)
            if (i % 5 != 0)  // some bytes of a range stay as they are
                bytes[i] = static_cast<char>('A' + i * 11 % 23);
    return bytes;
}

RecordedRepair repairOf(std::uint64_t length = 6192)
{
    return {{"/dev/sd\xff", 0, length, "1234-ABCD", "vfat", "a\nn\xc3\xa4me\xff"},
            {Subject::Filesystem, Operation::Repair},
            1000,
            today};
}

/// A store, and a disk of which the repaired view is another.
struct World {
    explicit World(const Remains& remains = {{}, oldDisk()})
        : disk(remains.disk), view(repaired(oldDisk()))
    {
        putStore(remains, storePath());
        open(noSync);
    }

    fs::path storePath() const { return directory / "store"; }
    void open(SyncFunction sync) { store = *UndoStore::open(storePath(), std::move(sync)); }
    UndoRecord save() { return *store->save(repairOf(), ranges, disk, view); }
    std::string apply()
    {
        UndoRecord record = save();
        EXPECT_TRUE(record.apply(disk));
        return record.id();
    }
    /// The record that an apply leaves when the disk stops taking writes at the third.
    std::string interrupt()
    {
        UndoRecord record = save();
        disk.failingFrom = 3;
        const auto done = record.apply(disk);
        EXPECT_TRUE(!done && done.error().left == Left::Interrupted);
        disk.failingFrom = 1 << 30;
        disk.writes = 0;
        return record.id();
    }

    TestDirectory directory;
    CachedDisk disk;
    CachedDisk view;
    std::optional<UndoStore> store;
};

enum class Way { Undo, Finish };

/// Brings a disk to one end from whatever a cut left; says what is not as it should be.
std::string faultAfter(const Remains& remains, Way way)
{
    World world(remains);
    const RecordList list = world.store->list();
    if (!list.broken.empty() || list.records.size() > 1)
        return "a record is broken";
    if (list.records.empty())
        return remains.disk == oldDisk() ? "" : "a changed disk without a record";
    auto record = world.store->take(list.records.front().id);
    if (!record)
        return std::string(record.error().key);
    const bool isApplied = record->facts().state == RecordState::Applied;
    if (isApplied && remains.disk != repaired(oldDisk()))
        return "Applied, and the disk is not as after";
    if (way == Way::Finish && isApplied)
        return "";
    const auto done = way == Way::Undo ? record->undo(world.disk) : record->finish(world.disk);
    if (!done)
        return std::string(done.error().sentence.key);
    if (!world.disk.pending.empty())
        return "not synced";
    if (way == Way::Undo)
        return world.disk.medium == oldDisk() && fs::is_empty(world.storePath()) ? ""
                                                                                 : "not undone";
    const RecordList after = world.store->list();
    return world.disk.medium == repaired(oldDisk()) && after.records.size() == 1 &&
                   after.records.front().facts.state == RecordState::Applied
               ? ""
               : "not finished";
}

/// Works in a world of which every moment is kept; answers what a cut could leave.
std::vector<Remains> everyCut(const Remains& from, const std::function<void(World&)>& work)
{
    World world(from);
    PowerCuts cuts(world.storePath(), world.disk);
    world.open(cuts.syncFunction());
    work(world);
    world.disk.happened = [] {
    };
    cuts.happened();
    return std::move(cuts.remains);
}

void expectRecovery(const std::vector<Remains>& remains, std::size_t atLeast)
{
    EXPECT_GT(remains.size(), atLeast);
    std::map<std::string, int> faults;
    for (const Remains& left : remains)
        for (const Way way : {Way::Undo, Way::Finish})
            ++faults[faultAfter(left, way)];
    faults.erase("");
    for (const auto& [fault, count] : faults)
        ADD_FAILURE() << fault << ", " << count << " times of " << 2 * remains.size();
}

const Remains untouched{{}, oldDisk()};

TEST(UndoPowerCut, WhileApplying)
{
    const auto cuts = everyCut(untouched, [](World& world) { world.apply(); });
    expectRecovery(cuts, 200);
    // What was told to be done is there, whatever was not synced is lost.
    const Remains& last = *(cuts.end() - 10);
    EXPECT_EQ(last.store.size(), 1U);
    EXPECT_EQ(last.disk, repaired(oldDisk()));
}

TEST(UndoPowerCut, WhilePuttingBack)
{
    expectRecovery(everyCut(untouched,
                            [](World& world) {
                                UndoRecord record = world.save();
                                world.disk.failingWrites = {3};
                                EXPECT_FALSE(record.apply(world.disk));
                            }),
                   200);
}

TEST(UndoPowerCut, WhileUndoing)
{
    Remains applied = everyCut(untouched, [](World& world) { world.apply(); }).back();
    const auto cuts = everyCut(applied, [](World& world) {
        auto record = world.store->take(world.store->list().records.at(0).id);
        ASSERT_TRUE(record);
        EXPECT_TRUE(record->undo(world.disk));
    });
    expectRecovery(cuts, 200);
    EXPECT_TRUE((cuts.end() - 10)->store.empty()) << "undone for good";
}

TEST(UndoPowerCut, WhileRecoveringFromACut)
{
    const auto cuts = everyCut(untouched, [](World& world) { world.apply(); });
    int recovered = 0;
    for (std::size_t i = 3; i < cuts.size(); i += 10) {
        const bool isMixed = cuts[i].disk != oldDisk() && cuts[i].disk != repaired(oldDisk());
        if (!isMixed)
            continue;
        ++recovered;
        for (const Way way : {Way::Undo, Way::Finish})
            expectRecovery(everyCut(cuts[i],
                                    [way](World& world) {
                                        auto record =
                                            world.store->take(world.store->list().records.at(0).id);
                                        ASSERT_TRUE(record);
                                        EXPECT_TRUE(way == Way::Undo ? record->undo(world.disk)
                                                                     : record->finish(world.disk));
                                    }),
                           50);
    }
    EXPECT_GE(recovered, 2);
}

// They are dealt with in pieces, of which one boundary lies in each large range.
TEST(UndoRecord, LargeRangesOfAFileAreWrittenAndPutBack)
{
    constexpr std::size_t size = 7 << 20;
    const std::vector<ByteRange> large{{100, 2'500'000}, {3'000'001, 1}, {3'500'000, 3'000'000}};
    const std::string before = oldDisk(size);
    const std::string after = repaired(before, large);
    World world;
    const fs::path name = world.directory / "disk";
    orvane::test::write(name, "beside" + before + "beside");
    const FileDescriptor file(::open(name.c_str(), O_RDWR | O_CLOEXEC));
    FileRegion disk(file.get(), 6, size);
    CachedDisk view(after);
    auto record = world.store->save(repairOf(size), large, disk, view);
    EXPECT_TRUE(record->apply(disk));
    EXPECT_TRUE(contentsOf(name) == "beside" + after + "beside");
    EXPECT_TRUE(record->undo(disk));
    EXPECT_TRUE(contentsOf(name) == "beside" + before + "beside");
}

TEST(UndoRecord, ADiskThatDoesNotTakeTheRepairIsPutBack)
{
    struct Case {
        std::function<void(CachedDisk&)> fault;
        std::string_view says;
        Left left;
        std::string_view because;
    };
    for (const Case& c :
         {Case{[](CachedDisk& disk) { disk.failingWrites = {2}; }, "cannot be written",
               Left::Unchanged, "a write fails once"},
          Case{[](CachedDisk& disk) { disk.badPlace = 4096; }, "cannot be written", Left::Unchanged,
               "a place cannot be written, and still has what it had"},
          Case{[](CachedDisk& disk) { disk.failingSyncs = 1; }, "cannot be written",
               Left::Unchanged, "the cache cannot be written"},
          Case{[](CachedDisk& disk) { disk.lostWrite = 3; }, "does not keep", Left::Unchanged,
               "a write is lost"},
          Case{[](CachedDisk& disk) { disk.failingFrom = 3; }, "cannot be written",
               Left::Interrupted, "it is not to be written any more"},
          Case{[](CachedDisk& disk) { disk.failingReadsFrom = disk.reads + 7; }, "cannot be read",
               Left::Interrupted, "what was written cannot be read any more"}}) {
        World world;
        std::string id;
        {
            UndoRecord record = world.save();
            id = record.id();
            c.fault(world.disk);
            const auto done = record.apply(world.disk);
            ASSERT_FALSE(done) << c.because;
            EXPECT_NE(done.error().sentence.key.find(c.says), std::string::npos) << c.because;
            EXPECT_EQ(done.error().left, c.left) << c.because;
        }
        const RecordList list = world.store->list();
        EXPECT_EQ(list.records.empty(), c.left == Left::Unchanged) << c.because;
        if (c.left == Left::Unchanged) {
            EXPECT_EQ(world.disk.medium, oldDisk()) << c.because;
            continue;
        }
        EXPECT_TRUE(list.records.at(0).isInterrupted());
        world.disk.failingFrom = world.disk.failingReadsFrom = 1 << 30;
        EXPECT_TRUE(world.store->take(id)->undo(world.disk)) << c.because;
        EXPECT_EQ(world.disk.medium, oldDisk()) << c.because;
    }
}

TEST(UndoRecord, WhatCanBePutBackIs)
{
    World world;
    UndoRecord record = world.save();
    world.disk.failingWrites = {3, 4};  // the third range, and putting back the first
    EXPECT_FALSE(record.apply(world.disk));
    EXPECT_EQ(world.disk.medium, repaired(oldDisk(), {ranges.front()}));
}

TEST(UndoRecord, UndoAndFinishAreTakenUpAgainAfterAFailure)
{
    World world;
    const std::string id = world.interrupt();
    for (const Way way : {Way::Finish, Way::Undo}) {
        world.disk.writes = 0;
        world.disk.failingWrites = {2};
        auto record = world.store->take(id);
        ASSERT_TRUE(record);
        for (const bool isGood : {false, true}) {
            const auto done =
                way == Way::Undo ? record->undo(world.disk) : record->finish(world.disk);
            EXPECT_EQ(static_cast<bool>(done), isGood);
            EXPECT_TRUE(isGood || done.error().left == Left::Interrupted);
        }
        EXPECT_EQ(world.disk.medium, way == Way::Undo ? oldDisk() : repaired(oldDisk()));
    }
}

TEST(UndoRecord, ADiskThatWasChangedSinceIsNotWritten)
{
    const auto expectRefusal = [](World& world, const auto& work) {
        const std::string disk = world.disk.cached;
        const auto done = work();
        ASSERT_FALSE(done);
        EXPECT_EQ(done.error().sentence.key, "nothing was changed: the disk was changed since");
        EXPECT_EQ(world.disk.cached, disk);
    };
    // A byte that the repair changes, in the last range; one that stays as it is; the disk's end.
    for (const std::size_t place : {std::size_t{6191}, std::size_t{5005}, std::size_t{6192}}) {
        const auto change = [place](CachedDisk& disk) {
            if (place == disk.cached.size())
                disk.cached.pop_back();
            else
                disk.cached[place] = '#';
        };
        World fresh;
        {
            UndoRecord record = fresh.save();
            change(fresh.disk);
            expectRefusal(fresh, [&] { return record.apply(fresh.disk); });
        }
        EXPECT_TRUE(fs::is_empty(fresh.storePath()));

        World applied;
        auto record = applied.store->take(applied.apply());
        change(applied.disk);
        expectRefusal(applied, [&] { return record->undo(applied.disk); });
        EXPECT_EQ(record->facts().state, RecordState::Applied);

        World interrupted;
        auto other = interrupted.store->take(interrupted.interrupt());
        change(interrupted.disk);
        expectRefusal(interrupted, [&] { return other->undo(interrupted.disk); });
        expectRefusal(interrupted, [&] { return other->finish(interrupted.disk); });
    }
}

TEST(UndoRecord, StopsOnlyBeforeTheFirstWrite)
{
    World world;
    UndoWork work;
    work.isStopped = [] {
        return true;
    };
    EXPECT_EQ(world.store->save(repairOf(), ranges, world.disk, world.view, work).error().key,
              "nothing was changed: it was stopped");
    EXPECT_TRUE(fs::is_empty(world.storePath()));
    work.isStopped = [&world] {
        return world.disk.writes > 0;
    };
    EXPECT_TRUE(world.save().apply(world.disk, work));
    EXPECT_EQ(world.disk.medium, repaired(oldDisk()));
}

// RLIMIT_FSIZE fails a write in its middle, as a full file system does.
TEST(UndoStore, WithoutRoomNothingIsTouched)
{
    const auto limitFiles = [](rlim_t bytes) {
        rlimit limit{};
        ::getrlimit(RLIMIT_FSIZE, &limit);
        limit.rlim_cur = std::min(bytes, limit.rlim_max);
        ::setrlimit(RLIMIT_FSIZE, &limit);
    };
    ::signal(SIGXFSZ, SIG_IGN);
    World world;
    limitFiles(4000);
    EXPECT_EQ(world.store->save(repairOf(), ranges, world.disk, world.view).error().key,
              "nothing was changed: the bytes kept for undoing cannot be written or read (%1$@)");
    limitFiles(RLIM_INFINITY);
    EXPECT_TRUE(fs::is_empty(world.storePath()));
    {
        UndoRecord record = world.save();
        limitFiles(100);
        EXPECT_FALSE(record.apply(world.disk));
        limitFiles(RLIM_INFINITY);
    }
    EXPECT_TRUE(world.store->list().records.empty());
    EXPECT_EQ(world.disk.writes, 0);
    const std::string id = world.apply();
    limitFiles(4000);
    const auto done = world.store->take(id)->undo(world.disk);
    limitFiles(RLIM_INFINITY);
    EXPECT_TRUE(!done && done.error().left == Left::Unchanged);
    EXPECT_EQ(world.disk.medium, repaired(oldDisk()));
    EXPECT_TRUE(world.store->take(id)->undo(world.disk));
    EXPECT_EQ(world.disk.medium, oldDisk());
}

TEST(UndoStore, RangesThatAreNoneAreRefused)
{
    World world;
    for (const std::vector<ByteRange>& wrong : {std::vector<ByteRange>{},
                                                {{0, 0}},
                                                {{6192, 1}},
                                                {{6000, 193}},
                                                {{10, 5}, {14, 2}},
                                                {{~std::uint64_t{0}, 2}},
                                                {{1, ~std::uint64_t{0}}},
                                                {{100, 1}, {50, 1}}})
        EXPECT_FALSE(world.store->save(repairOf(), wrong, world.disk, world.view));
    EXPECT_TRUE(fs::is_empty(world.storePath()));
}

TEST(UndoStore, WhatWasAlteredIsNeitherTrustedNorRemoved)
{
    for (const char* const name : {"facts", "ranges", "before", "after"})
        for (const bool isCut : {false, true}) {
            World world;
            const std::string id = world.interrupt();
            const fs::path file = world.storePath() / id / name;
            const std::string whole = contentsOf(file);
            if (isCut)
                fs::resize_file(file, whole.size() - 1);
            else
                orvane::test::patch(file, whole.size() / 2,
                                    whole[whole.size() / 2] == '1' ? "2" : "1");
            const RecordList list = world.store->list();
            EXPECT_EQ(list.broken.size() + list.records.size(), 1U) << name;
            EXPECT_TRUE(!isCut || list.broken.size() == 1) << name;
            const std::string disk = world.disk.cached;
            auto record = world.store->take(id);
            const std::string_view sentence = "nothing was changed: the saved bytes are damaged";
            EXPECT_EQ(record ? record->undo(world.disk).error().sentence.key : record.error().key,
                      sentence)
                << name;
            EXPECT_EQ(world.disk.cached, disk) << name;
            EXPECT_TRUE(fs::exists(file));
        }
    // An Applied one has only the bytes before.
    World world;
    const std::string id = world.apply();
    EXPECT_FALSE(fs::exists(world.storePath() / id / "after"));
    orvane::test::patch(world.storePath() / id / "before", 7, "#");
    EXPECT_FALSE(world.store->take(id)->undo(world.disk));
    EXPECT_EQ(world.disk.medium, repaired(oldDisk()));
    EXPECT_TRUE(world.store->remove(id));
    EXPECT_TRUE(fs::is_empty(world.storePath()));
}

TEST(UndoStore, ARecordIsOneProcessesAtATime)
{
    World world;
    UndoWork work;
    std::string id;
    int looks = 0;
    work.progress = [&](std::uint64_t done, std::uint64_t total) {
        EXPECT_LE(done, total);
        const RecordList list = world.store->list();  // must not take it for a leftover
        if (world.disk.writes == 0)
            return;
        ++looks;
        ASSERT_EQ(list.records.size(), 1U);
        EXPECT_TRUE(list.records[0].isInUse && !list.records[0].isInterrupted());
        id = list.records[0].id;
    };
    auto record = world.store->save(repairOf(), ranges, world.disk, world.view, work);
    ASSERT_TRUE(record);
    EXPECT_TRUE(record->apply(world.disk, work));
    EXPECT_GT(looks, 4);
    EXPECT_EQ(world.store->take(id).error().key, "the saved bytes are in use");
    EXPECT_FALSE(world.store->remove(id));
    const UndoRecord moved = std::move(*record);
    EXPECT_FALSE(world.store->take(id)) << "the lock goes with the record";
    EXPECT_TRUE(world.store->list().records.at(0).facts == moved.facts());
}

TEST(UndoStore, IsTheUsersAlone)
{
    World world;
    const std::string id = world.apply();
    for (const auto& entry : fs::recursive_directory_iterator(world.storePath()))
        EXPECT_EQ(static_cast<unsigned>(entry.status().permissions()),
                  entry.is_directory() ? 0700U : 0600U)
            << entry.path();
    const auto facts = world.store->list().records.at(0).facts;
    EXPECT_EQ(facts.repair, repairOf()) << "names of any bytes";
    EXPECT_EQ(facts.changedBytes, 4705U);
    // Links lead to nothing.
    fs::rename(world.storePath() / id, world.directory / "elsewhere");
    fs::create_directory_symlink(world.directory / "elsewhere", world.storePath() / id);
    EXPECT_EQ(world.store->list().broken, std::vector{id});
    EXPECT_FALSE(world.store->take(id));
    EXPECT_FALSE(world.store->take("../elsewhere"));
    fs::permissions(world.storePath(), fs::perms(0777));
    EXPECT_FALSE(UndoStore::open(world.storePath()));
    EXPECT_FALSE(UndoStore::open("relative"));
}

TEST(UndoStore, KeepsToLimitsAndNeverRemovesWhatIsInterrupted)
{
    World world;
    world.interrupt();
    RecordedRepair repair = repairOf();
    world.disk = CachedDisk(oldDisk());
    for (int day = 1; day <= 4; ++day) {
        repair.time = today + day * 24h;
        repair.disk.path = "/dev/sd" + std::to_string(day);
        auto record = world.store->save(repair, {{8, 100}}, world.disk, world.disk);
        ASSERT_TRUE(record && record->apply(world.disk));
    }
    repair.disk.path = "/dev/sd2";
    const RecordList list = world.store->list();
    const auto dayOf = [&](const std::string& uuid, std::uint64_t offset) {
        repair.disk.uuid = uuid;
        repair.disk.offset = offset;
        const ListedRecord* const newest = newestOf(repair.disk, list);
        return newest == nullptr ? 0 : (newest->facts.repair.time - today) / 24h;
    };
    EXPECT_EQ(dayOf("", 0), 2) << "by its path";
    EXPECT_EQ(dayOf("other", 0), 0) << "another file system has its place";
    EXPECT_EQ(dayOf("", 512), 0);
    repair.disk.path = "/dev/elsewhere";
    EXPECT_EQ(dayOf("1234-ABCD", 0), 4) << "by its UUID";
    world.directory.write("there", "");
    repair.disk.path = world.directory.path("there");
    repair.time = today + 5 * 24h;
    ASSERT_TRUE(world.store->save(repair, {{8, 100}}, world.disk, world.disk)->apply(world.disk));
    repair.disk.path = "/dev/elsewhere";
    EXPECT_EQ(newestOf(repair.disk, world.store->list())->facts.repair.time, today + 4 * 24h)
        << "a copy has the UUID, too";
    ASSERT_TRUE(world.store->remove(world.store->list().records.front().id));

    const auto now = today + 5 * 24h;
    const auto kept = [&](RecordLimits limits) {
        world.store->removeBeyond(limits, now);
        std::vector<int> days;
        for (const ListedRecord& record : world.store->list().records)
            days.push_back(static_cast<int>((record.facts.repair.time - today) / 24h));
        return days;
    };
    EXPECT_EQ(kept({5, 200h, 1 << 20}), (std::vector{4, 3, 2, 1, 0}));
    EXPECT_EQ(kept({4, 200h, 1 << 20}), (std::vector{4, 3, 2, 0})) << "number";
    EXPECT_EQ(kept({5, 60h, 1 << 20}), (std::vector{4, 3, 0})) << "age";
    EXPECT_EQ(kept({5, 200h, 4705 + 100}), (std::vector{4, 0})) << "bytes";
    {
        const auto inUse = world.store->take(world.store->list().records.at(0).id);
        EXPECT_EQ(kept({0, 0h, 0}), (std::vector{4, 0}));
    }
    EXPECT_EQ(kept({0, 0h, 0}), (std::vector{0}));
}

}  // namespace
}  // namespace pellar::test
