// SPDX-License-Identifier: Apache-2.0
// Repairs of permissions are taken back by their records, whatever became of either. Needs root.

#include "contract/pellar/ErrorCodes.h"
#include "pellar/packages/Permissions.h"
#include "pellar/permissions/PermissionRecords.h"
#include "pellar/process/Command.h"
#include "tests/pellar/permissions/DebianSystem.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <csignal>
#include <fstream>
#include <map>

namespace {

using namespace pellar;
using orvane::test::contentsOf;
using test::contains;
using test::DebianSystem;
using test::PermissionBench;
using test::Rights;
using test::rightsOf;

namespace fs = std::filesystem;

constexpr Task undo{Subject::Permissions, Operation::Undo};
constexpr uid_t player = 4242;

/// Everything but times, of one file.
struct Kept {
    Rights rights;
    std::string capabilities;

    friend bool operator==(const Kept&, const Kept&) = default;
};

class PermissionUndo : public testing::Test {
protected:
    void SetUp() override
    {
        if (const char* const obstacle = DebianSystem::obstacle())
            GTEST_SKIP() << obstacle;
        system_.install("games", {{"usr/", 0755},
                                  {"usr/bin/play", 0755},
                                  {"usr/bin/score", 02755, 0, 60},
                                  {"usr/share/games/", 01777},
                                  {"usr/share/games/levels", 0644},
                                  {"usr/share/games/link -> levels"},
                                  {"usr/share/games/ping", 0755},
                                  {"usr/bin/two", 0755}});
        options_ = test::tryingIn(state_.path("trials"));
        options_.trials.howToUndoPermissions = [](const contract::DiskReference&) {
            return "This is how.";
        };
        damage();
    }

    fs::path path(std::string_view name) const { return system_.path(name); }
    fs::path records() const { return permissionRecordsIn(options_.trials); }

    void damage() const
    {
        const auto give = [this](const char* name, uid_t user, gid_t group, mode_t mode) {
            EXPECT_EQ(::lchown(path(name).c_str(), user, group), 0);
            if (!fs::is_symlink(path(name)))
                ::chmod(path(name).c_str(), mode);
        };
        give("usr/bin/play", player, 60, 06711);
        give("usr/bin/score", player, 0, 0600);
        give("usr/bin/two", 0, 60, 0750);
        give("usr/share/games", player, 60, 0700);
        give("usr/share/games/levels", 0, 60, 0666);
        give("usr/share/games/link", player, 60, 0);
        give("usr/share/games/ping", player, 0, 0777);
        setPing("cap_net_raw=ep");
    }

    void setPing(const std::string& capabilities) const
    {
        const FileDescriptor file(::open(path("usr/share/games/ping").c_str(), O_PATH | O_CLOEXEC));
        EXPECT_EQ(setCapabilities(file.get(), capabilities), 0);
    }

    std::map<std::string, Kept> all() const
    {
        std::map<std::string, Kept> found;
        for (const auto& entry : fs::recursive_directory_iterator(path("usr"))) {
            const FileDescriptor file(
                ::open(entry.path().c_str(), O_PATH | O_NOFOLLOW | O_CLOEXEC));
            found[entry.path()] = {rightsOf(entry.path()),
                                   entry.is_symlink()
                                       ? std::string()
                                       : capabilitiesOf(file.get()).value_or("unknown")};
        }
        return found;
    }

    PermissionRecordList list() const
    {
        const auto store = PermissionRecords::open(records());
        return store ? store->list() : PermissionRecordList();
    }
    fs::path onlyRecord() const
    {
        const auto listed = list().records;
        EXPECT_EQ(listed.size(), 1U);
        return listed.empty() ? fs::path() : records() / listed.front().id;
    }

    DebianSystem system_;
    test::TestDirectory state_;
    JobOptions options_;
};

TEST_F(PermissionUndo, EveryFileHasAgainWhatItHadBefore)
{
    system_.install("names", {{"usr/bin/two-names", 0755}});
    fs::remove(path("usr/bin/two-names"));
    fs::create_hard_link(path("usr/bin/two"), path("usr/bin/two-names"));
    const auto before = all();
    options_.trials.isPublic = true;
    const fs::path index = permissionIndexIn(options_.trials.room.directory);
    PermissionBench bench(options_);
    bench.repairPermissions(system_.disk());
    EXPECT_EQ(bench.listener.verdict, "repaired") << bench.problems();
    EXPECT_FALSE(contains(bench.problems(), "changed while it was looked at"));
    for (const char* const written : {"with the record", "by the next listing"}) {
        const RecordList known = *readPublicIndex(index);
        ASSERT_EQ(known.records.size(), 1U) << written;
        EXPECT_EQ(known.records.front().id, onlyRecord().filename());
        EXPECT_EQ(known.records.front().facts.repair.task.subject, Subject::Permissions);
        EXPECT_FALSE(contains(contentsOf(index / known.records.front().id), "usr")) << "no files";
        fs::remove(index / known.records.front().id);
        EXPECT_EQ(openPermissionRecords(options_.trials)->list().records.size(), 1U);
    }
    EXPECT_NE(all(), before);
    EXPECT_TRUE(contains(bench.remarks(), "This is how.\n"));
    const auto listed = list().records;
    ASSERT_EQ(listed.size(), 1U);
    EXPECT_EQ(listed.front().fileCount, 7U) << "one for all names";
    EXPECT_EQ(listed.front().run.repair.user, 0U);
    EXPECT_EQ(listed.front().run.repair.disk.name, "Disk");
    EXPECT_FALSE(listed.front().isInUse);
    // Names come and go in a directory.
    ASSERT_EQ(::mkfifo(path("usr/share/games/new").c_str(), 0600), 0);
    fs::remove(path("usr/share/games/new"));

    bench.run(undo, system_.disk());
    EXPECT_EQ(bench.listener.verdict, "undone") << bench.listener.message;
    EXPECT_EQ(
        bench.listener.message,
        "undid the repair of the permissions on “Disk”: 7 files were put back; left alone: 0");
    EXPECT_EQ(all(), before);
    EXPECT_TRUE(list().records.empty());
    EXPECT_TRUE(readPublicIndex(index)->records.empty());
    bench.run(undo, system_.disk());
    EXPECT_EQ(bench.listener.error, contract::kPLErrorNothingToUndo);
}

// The undo must lend no rights to what somebody else has put into a file since.
TEST_F(PermissionUndo, AFileThatWasChangedSinceIsLeftAlone)
{
    PermissionBench bench(options_);
    const auto before = all();
    bench.repairPermissions(system_.disk());
    const auto repaired = all();
    system_.write("usr/bin/play", "another's\n");
    ::chmod(path("usr/bin/score").c_str(), 02754);
    ::chmod(path("usr/bin/score").c_str(), 02755);
    fs::remove(path("usr/share/games/link"));
    fs::create_symlink("levels", path("usr/share/games/link"));
    fs::rename(path("usr/share/games/ping"), path("aside"));
    bench.run(undo, system_.disk());
    EXPECT_EQ(bench.listener.verdict, "undone");
    EXPECT_TRUE(contains(bench.listener.message, "3 files were put back; left alone: 4"))
        << bench.listener.message;
    for (const char* const name : {"usr/bin/play", "usr/bin/score", "usr/share/games/link"}) {
        EXPECT_TRUE(contains(bench.problems(),
                             "“" + std::string(name) + "” was changed since and was left alone."))
            << bench.problems();
        EXPECT_EQ(rightsOf(path(name)), repaired.at(path(name)).rights) << name;
    }
    EXPECT_TRUE(contains(bench.problems(), "“usr/share/games/ping” is not there."));
    EXPECT_EQ(rightsOf(path("usr/share/games")), before.at(path("usr/share/games")).rights);
    EXPECT_TRUE(list().records.empty()) << "nothing is left to be undone";
}

TEST_F(PermissionUndo, NoneOfTheFilesIsAsItWasLeft)
{
    PermissionBench bench(options_);
    bench.repairPermissions(system_.disk());
    for (const char* const name : {"bin/play", "bin/score", "bin/two", "share/games",
                                   "share/games/levels", "share/games/link", "share/games/ping"})
        ASSERT_EQ(::lchown(path(std::string("usr/") + name).c_str(), 77, 77), 0);
    bench.run(undo, system_.disk());
    EXPECT_EQ(bench.listener.error, contract::kPLErrorNotUndone) << bench.listener.message;
}

// Whatever part of the record was lost after the sync that precedes a change: all is undone. Some
// files are as they were, one is on the way.
TEST_F(PermissionUndo, ARecordThatWasCutOffAfterItsSyncUndoesEverything)
{
    const auto before = all();
    for (std::size_t lost = 0; lost < 8; ++lost) {
        PermissionBench bench(options_);
        bench.repairPermissions(system_.disk());
        const fs::path record = onlyRecord();
        std::string text = contentsOf(record);
        // Seven lines of what became of the files are the end, of which `lost` are not whole.
        std::size_t end = text.size();
        for (std::size_t i = 0; i < lost; ++i)
            end = text.rfind('\n', end - 2) + 1;
        EXPECT_EQ(contains(text.substr(end), "before"), false);
        fs::resize_file(record, std::min(end + (lost > 0 ? 20 : 0), text.size()));
        if (lost == 7) {  // the kill came between the owner and the mode
            ::chmod(path("usr/bin/score").c_str(), 0600);
            ASSERT_EQ(::chown(path("usr/bin/play").c_str(), player, 60), 0);
        }
        if (lost == 0) {  // or it came there in the undo
            const auto store = PermissionRecords::open(records());
            auto taken = store->take(record.filename());
            for (std::size_t i = 0; i < taken->changes().size(); ++i)
                ASSERT_EQ(taken->note(i, ChangeStage::TakingBack, {}), 0);
            ASSERT_EQ(::chown(path("usr/share/games/levels").c_str(), 0, 60), 0);
        }
        bench.run(undo, system_.disk());
        EXPECT_EQ(bench.listener.verdict, "undone") << bench.listener.message;
        EXPECT_EQ(all(), before) << lost << bench.problems();
        EXPECT_FALSE(contains(bench.problems(), "damaged")) << "a cut is no damage";
    }
}

// Without the line that says how it was left, contents tell whether a file is still the same.
TEST_F(PermissionUndo, AFileOfAnInterruptedRepairThatWasWrittenToIsLeftAlone)
{
    PermissionBench bench(options_);
    bench.repairPermissions(system_.disk());
    const fs::path record = onlyRecord();
    const std::string text = contentsOf(record);
    fs::resize_file(record, text.find("\"stage\"") - 30);
    system_.write("usr/share/games/levels", "another's\n");
    // With the old time put back, as an owner can; the second is another file.
    for (const char* const name : {"usr/bin/play", "usr/bin/two"}) {
        struct stat status = {};
        ASSERT_EQ(::stat(path(name).c_str(), &status), 0);
        if (path(name).filename() == "two")
            fs::rename(path(name), path("aside"));
        system_.write(name, "another's\n");
        ::chmod(path(name).c_str(), 0755);
        const std::array<timespec, 2> times{status.st_atim, status.st_mtim};
        ASSERT_EQ(::utimensat(AT_FDCWD, path(name).c_str(), times.data(), 0), 0);
    }
    bench.run(undo, system_.disk());
    EXPECT_EQ(rightsOf(path("usr/share/games/levels")), (Rights{0644, 0, 0}));
    EXPECT_EQ(rightsOf(path("usr/bin/play")), (Rights{0755, 0, 0})) << "not the contents of then";
    EXPECT_EQ(rightsOf(path("usr/bin/two")), (Rights{0755, 0, 0}));
    EXPECT_TRUE(contains(bench.listener.message, "4 files were put back; left alone: 3"))
        << bench.listener.message;
}

TEST_F(PermissionUndo, ADamagedLineCostsItsFileAlone)
{
    PermissionBench bench(options_);
    bench.repairPermissions(system_.disk());
    const fs::path record = onlyRecord();
    std::string text = contentsOf(record);
    text[text.find("usr/bin/score")] = 'v';
    std::ofstream(record) << text;
    bench.run(undo, system_.disk());
    EXPECT_TRUE(contains(bench.problems(), "1 entry of the record is damaged")) << bench.problems();
    EXPECT_TRUE(contains(bench.listener.message, "6 files were put back"))
        << bench.listener.message;
    EXPECT_EQ(rightsOf(path("usr/bin/score")), (Rights{02755, 0, 60}));
}

// The kernel kills the process (SIGXFSZ) in the write by which a file of it grows too long, here
// the record: within a line, before the changes or between two of them.
TEST_F(PermissionUndo, KilledOrOutOfSpaceInTheMiddleNothingIsLost)
{
    std::vector<test::PackageFile> files;
    for (int i = 0; i < 400; ++i)
        files.push_back({"usr/share/many/" + std::to_string(i), 0644});
    system_.install("many", files);
    for (const auto& file : files) {
        ASSERT_EQ(::chown(path(file.path).c_str(), player, 60), 0);
        ASSERT_EQ(::chmod(path(file.path).c_str(), 04711), 0);
    }
    const auto before = all();
    const auto endingAt = [&](std::uintmax_t size, sighandler_t atSize, const auto& work) {
        return orvane::test::statusOfChild([&] {
            const rlimit none{0, 0};
            const rlimit longest{size, size};
            ::setrlimit(RLIMIT_CORE, &none);
            ::setrlimit(RLIMIT_FSIZE, &longest);
            ::signal(SIGXFSZ, atSize);
            PermissionBench bench(options_);
            work(bench);
            return contains(bench.listener.message, "could not be kept") ? 1 : 0;
        });
    };
    for (const std::uintmax_t size : {61'234U, 75'000U, 80'001U, 100'001U, 140'000U}) {
        EXPECT_EQ(
            endingAt(size, SIG_DFL,
                     [&](PermissionBench& bench) { bench.repairPermissions(system_.disk()); }),
            SIGXFSZ);
        EXPECT_NE(all(), before) << size;
        EXPECT_EQ(endingAt(fs::file_size(onlyRecord()) + size / 30, SIG_DFL,
                           [&](PermissionBench& bench) { bench.run(undo, system_.disk()); }),
                  SIGXFSZ);
        PermissionBench bench(options_);
        bench.run(undo, system_.disk());
        EXPECT_EQ(bench.listener.verdict, "undone");
        EXPECT_TRUE(contains(bench.listener.message, "left alone: 0")) << bench.listener.message;
        EXPECT_FALSE(contains(bench.problems(), "damaged")) << "what was cut off is no damage";
        EXPECT_EQ(all(), before) << size << bench.problems();
        EXPECT_TRUE(list().records.empty());
    }
    // The medium is full in the middle.
    const int status = endingAt(
        80'000, SIG_IGN, [&](PermissionBench& bench) { bench.repairPermissions(system_.disk()); });
    EXPECT_TRUE(WIFEXITED(status) && WEXITSTATUS(status) == 1) << "it says why it went no further";
    EXPECT_NE(all(), before);
    PermissionBench bench(options_);
    bench.run(undo, system_.disk());
    EXPECT_EQ(all(), before) << bench.problems();
}

TEST_F(PermissionUndo, WhereNoRecordCanBeKeptNothingIsChanged)
{
    const auto before = all();
    fs::create_directories(options_.trials.room.directory);
    std::ofstream(records()) << "in the way";
    PermissionBench bench(options_);
    bench.repairPermissions(system_.disk());
    EXPECT_EQ(bench.listener.error, contract::kPLErrorPermissionsNotRepaired);
    EXPECT_TRUE(contains(bench.listener.message, "there is no directory to keep the permissions"))
        << bench.listener.message;
    EXPECT_EQ(all(), before);
    // Without a directory, or a wish, there is no record and no objection.
    options_.repairPolicy = [] {
        RepairPolicy policy;
        policy.keepsUndo = false;
        return policy;
    };
    PermissionBench careless(options_);
    careless.repairPermissions(system_.disk());
    EXPECT_EQ(careless.listener.verdict, "repaired") << careless.listener.message;
    damage();
    options_.repairPolicy = {};
    options_.trials.room.directory.clear();
    PermissionBench without(options_);
    without.repairPermissions(system_.disk());
    EXPECT_EQ(without.listener.verdict, "repaired");
    without.run(undo, system_.disk());
    EXPECT_EQ(without.listener.error, contract::kPLErrorNothingToUndo);
}

TEST_F(PermissionUndo, ARecordIsForItsUserItsSystemAndItsTime)
{
    PermissionBench bench(options_);
    bench.repairPermissions(system_.disk());
    const auto repaired = all();
    JobOptions others = options_;
    others.trials.user = player;
    PermissionBench another(others);
    another.run(undo, system_.disk());
    EXPECT_EQ(another.listener.error, contract::kPLErrorNotAuthorized);
    DebianSystem elsewhere;
    bench.run(undo, elsewhere.disk());
    EXPECT_EQ(bench.listener.error, contract::kPLErrorNothingToUndo);
    EXPECT_EQ(bench.run({Subject::Permissions, Operation::Finish}, system_.disk()),
              contract::kPLErrorUnsupported);
    EXPECT_EQ(all(), repaired);
}

TEST_F(PermissionUndo, RecordsAreKeptWithinTheirLimits)
{
    options_.trials.limits = [] {
        return RecordLimits{2, std::chrono::hours(1), 0};
    };
    for (int i = 0; i < 3; ++i) {
        damage();
        PermissionBench bench(options_);
        bench.repairPermissions(system_.disk());
    }
    EXPECT_EQ(list().records.size(), 2U);
    const auto store = PermissionRecords::open(records());
    const auto leftAfter = [&](RecordLimits limits, int hours) {
        store->removeBeyond(limits, std::chrono::system_clock::now() + std::chrono::hours(hours));
        return list().records.size();
    };
    {
        const auto held = store->take(list().records.front().id);
        EXPECT_TRUE(held && list().records.front().isInUse);
        EXPECT_EQ(leftAfter({0, std::chrono::hours(1), 0}, 0), 1U) << "one that is in use stays";
    }
    EXPECT_EQ(leftAfter({20, std::chrono::hours(1), 0}, 2), 0U) << "age";
}

}  // namespace
