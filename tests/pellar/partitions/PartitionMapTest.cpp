// SPDX-License-Identifier: Apache-2.0
#include "contract/pellar/ErrorCodes.h"
#include "pellar/partitions/MapDisk.h"
#include "pellar/partitions/MapReport.h"
#include "pellar/process/FileDescriptor.h"
#include "tests/pellar/partitions/DiskMaker.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/file.h>
#include <sys/stat.h>

#include <algorithm>
#include <cstring>
#include <fstream>
#include <set>

namespace {

using namespace pellar;
using test::DiskImage;
using test::mebibyte;
using enum FindingKind;
namespace fs = std::filesystem;

// Sector 32767 is the last of 16 MiB; the backup list is in the 32 sectors before it.
constexpr std::uint64_t lastSector = 32767;
constexpr std::uint64_t backupHeader = lastSector * 512;
constexpr std::uint64_t backupEntries = (lastSector - 32) * 512;
constexpr std::uint64_t protective = mbrEntriesOffset;
constexpr auto sound = MapVerdict::Sound;
constexpr auto repairable = MapVerdict::Repairable;
constexpr auto person = MapVerdict::NeedsPerson;

const Bytes ordinaryEntry{0, 0, 2, 0, 0x83, 0, 0, 0, 0, 8, 0, 0, 0, 32, 0, 0};

using Disk = const DiskImage&;

struct DamageCase {
    void (*damage)(Disk d);
    std::vector<FindingKind> kinds;  ///< all of them
    MapVerdict verdict = person;
};

std::string kindsOf(const MapReport& report)
{
    std::string kinds;
    for (const Finding& finding : report.findings)
        kinds += std::string(textOf(finding.kind)) + "\n";
    return kinds;
}

MapReport reportOf(const fs::path& image)
{
    return reportOn(glanceAtMap(*test::wholeDisk(image)));
}

void expectReport(const fs::path& image, const DamageCase& c)
{
    const MapReport report = reportOf(image);
    EXPECT_EQ(report.verdict, c.verdict) << kindsOf(report);
    for (const FindingKind kind : c.kinds)
        EXPECT_TRUE(report.has(kind)) << textOf(kind) << "\n" << kindsOf(report);
    EXPECT_EQ(report.findings.size(), c.kinds.size()) << kindsOf(report);
}

struct MapBench : test::JobFixture {
    explicit MapBench(const fs::path& saved) : JobFixture(test::tryingIn(saved)) {}

    void verifyMap(const fs::path& disk)
    {
        finish(tool->beginPartitionMapVerifyForDisk(test::wholeDisk(disk)));
    }
    void repairMap(const fs::path& disk)
    {
        finish(tool->beginPartitionMapRepairForDisk(test::wholeDisk(disk)));
    }
};

void expectToolsAgree(const fs::path& disk)
{
    const test::ToolAnswer sfdisk = test::runTool({"sfdisk", "--verify", disk});
    EXPECT_TRUE(test::contains(sfdisk.output, "No errors detected")) << sfdisk.output;
}

/// The sectors in which two disks differ; the shorter one is followed by zeros.
std::set<std::uint64_t> differences(Bytes a, Bytes b)
{
    a.resize(std::max(a.size(), b.size()));
    b.resize(a.size());
    std::set<std::uint64_t> sectors;
    for (std::size_t i = 0; i < a.size(); i += 512)
        if (std::memcmp(a.data() + i, b.data() + i, 512) != 0)
            sectors.insert(i / 512);
    return sectors;
}

/// Carried out: what is kept, what is written, and what the disk is then.
void expectRepaired(MapBench& bench, const DiskImage& disk, const Bytes& before)
{
    const Bytes damaged = disk.bytes();
    bench.verifyMap(disk.path());
    EXPECT_EQ(bench.listener.error, contract::kPLErrorMapDamaged);
    EXPECT_TRUE(disk.bytes() == damaged) << "a verification has written";
    bench.repairMap(disk.path());
    EXPECT_EQ(bench.listener.verdict, "repaired") << bench.listener.message;
    const Bytes after = disk.bytes();
    if (after.size() == before.size()) {
        EXPECT_TRUE(differences(after, before).empty());
    }
    for (const std::uint64_t sector : differences(after, damaged))
        EXPECT_TRUE(sector <= 33 || sector >= lastSector - 32) << "sector " << sector;
    expectToolsAgree(disk.path());
    bench.verifyMap(disk.path());
    EXPECT_EQ(bench.listener.verdict, "sound");
    bench.run({Subject::PartitionMap, Operation::Undo}, test::wholeDisk(disk.path()));
    EXPECT_EQ(bench.listener.verdict, "undone") << bench.listener.message;
    EXPECT_TRUE(disk.bytes() == damaged) << "what was kept is not what was there";
}

void expectUntouched(const test::TestDirectory& workshop, MapBench& bench, const DiskImage& disk)
{
    const Bytes damaged = disk.bytes();
    bench.verifyMap(disk.path());
    EXPECT_EQ(bench.listener.error, contract::kPLErrorMapNeedsPerson);
    bench.repairMap(disk.path());
    EXPECT_EQ(bench.listener.error, contract::kPLErrorMapNotRepaired);
    EXPECT_TRUE(disk.bytes() == damaged);
    EXPECT_FALSE(fs::exists(workshop.path("saved"))) << "nothing to be kept";
}

TEST(PartitionMaps, AGPTIsRestoredWhereItIsThereTwiceAndLeftAloneElsewhere)
{
    const std::vector<DamageCase> cases{
        {[](Disk) {}, {}, sound},
        {[](Disk d) { d.fill(512, 33 * 512, 0); }, {PrimaryMissing}, repairable},
        {[](Disk d) { d.flip(512 + 40); }, {PrimaryHeaderChecksum}, repairable},
        {[](Disk d) { d.flip(1024 + 300); }, {PrimaryEntriesChecksum}, repairable},
        {[](Disk d) { d.fill(backupEntries, 33 * 512, 0); }, {BackupMissing}, repairable},
        {[](Disk d) { d.flip(backupHeader + 40); }, {BackupHeaderChecksum}, repairable},
        {[](Disk d) { d.flip(backupEntries + 300); }, {BackupEntriesChecksum}, repairable},
        {[](Disk d) { d.flip(1024).flip(backupEntries); },
         {PrimaryEntriesChecksum, BackupEntriesChecksum, NoValidCopy}},
        // Only the protective entry tells that there was a map.
        {[](Disk d) { d.fill(512, 512, 0).fill(backupHeader, 512, 0); },
         {PrimaryMissing, BackupMissing, NoValidCopy}},
        // Another name, and the right checksum of it.
        {[](Disk d) { d.flip(backupEntries + 56).seal(lastSector); }, {CopiesDiffer}, repairable},
        {[](Disk d) { d.set(512 + 24, 8, 5).seal(1); }, {PrimaryHeaderNumbers}, repairable},
        {[](Disk d) { d.resize(24 * mebibyte); },
         {BackupNotAtEnd, ProtectiveWrongSize},
         repairable},
        // The protective entry tells where the backup is.
        {[](Disk d) { d.fill(512, 512, 0).resize(backupHeader + 6 * 512); },
         {PrimaryMissing, BackupNotAtEnd, ProtectiveWrongSize},
         repairable},
        {[](Disk d) { d.resize(14 * mebibyte); }, {DiskCut, ProtectiveWrongSize}},
        {[](Disk d) { d.resize(11 * mebibyte); }, {DiskCut, ProtectiveWrongSize, BeyondDisk}},
        {[](Disk d) { d.fill(protective, 66, 0); }, {ProtectiveMissing}, repairable},
        {[](Disk d) { d.set(protective + 12, 4, 77); }, {ProtectiveWrongSize}, repairable},
        {[](Disk d) { d.set(protective + 12, 4, 0xFFFFFFFF); }, {}, sound},  // stands for any size
        {[](Disk d) { d.set(protective + 8, 4, 7); }, {ProtectiveWrongStart}, repairable},
        {[](Disk d) { d.set(protective + 4, 1, 0x83); }, {ProtectiveReplaced}},
        {[](Disk d) { d.put(protective + 16, ordinaryEntry); }, {Hybrid}, sound},
        {[](Disk d) { d.put(protective, ordinaryEntry); }, {Remnants}, sound},
        {[](Disk d) { d.setEntry(2, 10000, 14335); }, {Overlap, Overlap}},
        {[](Disk d) { d.setEntry(2, 24575, 20480); }, {EndBeforeStart}},
        {[](Disk d) { d.setEntry(2, 24575, 20480).flip(backupHeader); },
         {EndBeforeStart, BackupMissing}},
        {[](Disk d) { d.setEntry(2, 20480, 32768); }, {BeyondDisk}},     // by one sector
        {[](Disk d) { d.setEntry(2, 20480, 32740); }, {OutsideUsable}},  // the backup's list
        {[](Disk d) { d.setEntry(2, 40, 1000); }, {OutsideUsable}},
        {[](Disk d) { d.setEntry(2, 20480, ~0ULL); }, {BeyondDisk}},
        {[](Disk d) { d.putIntoEntries(144, d.part(1040, 16)); }, {SameIdentifier}},
    };
    for (const DamageCase& c : cases) {
        const test::TestDirectory workshop;
        const DiskImage disk = DiskImage::gpt(workshop);
        const Bytes before = disk.bytes();
        c.damage(disk);
        SCOPED_TRACE(&c - cases.data());
        expectReport(disk.path(), c);
        MapBench bench(workshop.path("saved"));
        if (c.verdict == repairable)
            expectRepaired(bench, disk, before);
        if (c.verdict == person)
            expectUntouched(workshop, bench, disk);
    }
}

TEST(PartitionMaps, AnMBRIsOnlyJudged)
{
    // Primaries at 2048, 6144 and 23000, an extended one at 10240 with two logical ones in it.
    constexpr std::string_view script =
        "start=2048, size=4096, bootable\nstart=6144, size=4096\nstart=10240, size=12288, type=5\n"
        "start=23000, size=10\nstart=12288, size=2048\nsize=2048\n";
    constexpr std::uint64_t first = mbrEntriesOffset;
    constexpr std::uint64_t chain = 10240 * 512 + mbrEntriesOffset;
    const std::vector<DamageCase> cases{
        {[](Disk d) { d.set(first, 1, 0x42); }, {BadBootFlag}},
        {[](Disk d) { d.set(first + 16, 1, 0x80); }, {TwoActive}},
        {[](Disk d) { d.set(first + 12, 4, 5000); }, {Overlap}},
        {[](Disk d) { d.set(first + 32 + 12, 4, 0xFFFFFFF0); }, {BeyondDisk, Overlap}},
        {[](Disk d) { d.set(first + 12, 4, 0); }, {EmptyPartition}},
        {[](Disk d) { d.set(first + 8, 4, 0); }, {StartsAtMap}},
        // A second one, without partitions.
        {[](Disk d) { d.set(first + 4, 1, 5).set(2048 * 512 + 510, 2, 0xAA55); },
         {SeveralExtended}},
        {[](Disk d) { d.fill(10240 * 512 + 510, 2, 0); }, {ChainBroken}},
        {[](Disk d) { d.set(chain + 16 + 8, 4, 0); }, {ChainLoop}},  // back to the start
        {[](Disk d) { d.set(chain + 16 + 8, 4, 20000); }, {ChainOutside}},
        {[](Disk d) { d.set(chain + 16 + 8, 4, 0xFFFFFFFF); }, {ChainOutside}},
        {[](Disk d) { d.set(chain + 12, 4, 20000); }, {OutsideExtended, Overlap}},
    };
    for (const DamageCase& c : cases) {
        const test::TestDirectory workshop;
        const DiskImage disk = DiskImage::mbr(workshop, script);
        expectReport(disk.path(), {c.damage, {}, sound});
        c.damage(disk);
        SCOPED_TRACE(&c - cases.data());
        expectReport(disk.path(), c);
    }
}

TEST(PartitionMaps, NothingThatIsNoMapIsTakenForOne)
{
    const test::TestDirectory workshop;
    workshop.write("empty", {});
    workshop.write("short", std::string(700, 'x'));
    workshop.write("zeros", std::string(1 << 20, '\0'));
    workshop.makeExt("ext4", 8 * mebibyte);
    workshop.makeVolume("fat", "vfat");  // its boot sector looks like an MBR
    for (const std::string_view name : {"nothing", "empty", "short", "zeros", "ext4", "fat"})
        EXPECT_EQ(reportOf(workshop.path(name)).verdict, MapVerdict::None) << name;
}

// The danger: a repairer that restores such a map destroys the file system's start.
TEST(PartitionMaps, AFileSystemInAnOldMapsPlaceIsLeftAlone)
{
    const test::TestDirectory workshop;
    const DiskImage disk = DiskImage::gpt(workshop);
    const Bytes backup = disk.bytes();
    workshop.makeExt("volume", 16 * mebibyte);
    fs::rename(workshop.path("volume"), disk.path());
    disk.put(backupEntries, ByteView(backup).subspan(backupEntries));
    EXPECT_EQ(reportOf(disk.path()).verdict, MapVerdict::None) << "only the backup is left of it";
    disk.put(0, ByteView(backup).first(512));
    const MapReport report = reportOf(disk.path());
    EXPECT_TRUE(report.verdict == person && report.has(DiskFilled)) << kindsOf(report);
}

// A RAID keeps its superblock behind the array's map, which then is not at the end of the disk; the
// mark of an optical disc is easier to make.
TEST(PartitionMaps, WhatFillsTheDiskMayOwnItsEnd)
{
    const test::TestDirectory workshop;
    const DiskImage disk = DiskImage::gpt(workshop);
    disk.put(32768, Bytes{1, 'C', 'D', '0', '0', '1', 1});
    disk.put(32768 + 2048, Bytes{255, 'C', 'D', '0', '0', '1', 1});
    EXPECT_EQ(reportOf(disk.path()).verdict, sound);
    disk.resize(20 * mebibyte);
    const MapReport grown = reportOf(disk.path());
    EXPECT_TRUE(grown.verdict == person && grown.has(DiskFilled)) << kindsOf(grown);
    disk.resize(16 * mebibyte);
    disk.fill(backupHeader, 512, 0);
    const MapReport lost = reportOf(disk.path());
    EXPECT_TRUE(lost.verdict == person && lost.has(DiskFilled)) << kindsOf(lost);
}

TEST(PartitionMaps, LargeSectorsAreFoundByThemselves)
{
    const test::TestDirectory workshop;
    const auto path = workshop.makeFile("large", 32 * mebibyte);
    ASSERT_EQ(test::runTool({"fdisk", "-b", "4096", path}, "g\nn\n\n\n+4M\nn\n\n\n+4M\nw\n").status,
              0);
    EXPECT_EQ(glanceAtMap(*test::wholeDisk(path)).sectorBytes, 4096U);
    EXPECT_EQ(reportOf(path).verdict, sound) << kindsOf(reportOf(path));
    const Bytes before = test::fileBytes(path);
    std::fstream(path, std::ios::in | std::ios::out | std::ios::binary).seekp(4096) << "12345678";
    EXPECT_TRUE(reportOf(path).has(PrimaryMissing)) << kindsOf(reportOf(path));
    MapBench bench(workshop.path("saved"));
    bench.repairMap(path);
    EXPECT_EQ(bench.listener.verdict, "repaired") << bench.listener.message;
    EXPECT_TRUE(test::fileBytes(path) == before);
}

TEST(PartitionMaps, NamesCannotForgeAnything)
{
    const test::TestDirectory workshop;
    const DiskImage disk = DiskImage::gpt(workshop);
    const std::string_view name(
        "\x1b\0[\0"
        "3\0"
        "1\0m\0%\0"
        "1\0$\0@\0\n\0\x2e\x20\x00\xD8",
        24);
    disk.putIntoEntries(56, Bytes(name.begin(), name.end()));
    disk.setEntry(1, 2048, 12300);
    const MapReport report = reportOf(disk.path());
    ASSERT_EQ(report.findings.size(), 1U) << kindsOf(report);
    const auto label = std::get<std::string>(report.findings.front().arguments.front());
    for (const std::string_view part : {"\x1b", "\n", "%1$@", "\xE2\x80\xAE"})
        EXPECT_FALSE(test::contains(label, part)) << label;
}

// A list with as many partitions as are allowed, all in one place.
TEST(PartitionMaps, ManyFindingsAreCut)
{
    const test::TestDirectory workshop;
    const DiskImage disk = DiskImage::gpt(workshop);
    const Bytes entry = disk.part(1024, 128);
    Bytes all;
    for (int i = 0; i < 128; ++i)
        all.insert(all.end(), entry.begin(), entry.end());
    disk.putIntoEntries(0, all);
    const MapReport report = reportOf(disk.path());
    EXPECT_EQ(report.verdict, person);
    EXPECT_LE(report.findings.size(), 51U);
    EXPECT_EQ(report.findings.back().kind, More);
}

// Some boards start from sector 2 and have their list of partitions behind their loader.
TEST(PartitionMaps, AListBehindALoaderIsFoundAndTheLoaderLeft)
{
    const test::TestDirectory workshop;
    const DiskImage disk = DiskImage::gpt(workshop);
    if (test::runTool({"sgdisk", "-j", "1000", disk.path()}).status != 0)
        GTEST_SKIP() << "sgdisk is not installed";
    disk.fill(1024, 900 * 512, 0x42);
    const Bytes before = disk.bytes();
    disk.fill(512, 512, 0);
    MapBench bench(workshop.path("saved"));
    bench.repairMap(disk.path());
    EXPECT_EQ(bench.listener.verdict, "repaired") << bench.listener.message;
    EXPECT_TRUE(differences(disk.bytes(), before).empty());
}

TEST(PartitionMaps, WithoutAPlaceForTheOldSectorsNothingIsWritten)
{
    const test::TestDirectory workshop;
    workshop.write("file", "x");
    for (const fs::path& saved : {fs::path(), fs::path("relative"), workshop.path("file") / "below",
                                  fs::path("/proc/nowhere")}) {
        const DiskImage disk = DiskImage::gpt(workshop);
        disk.fill(512, 512, 0);
        const Bytes damaged = disk.bytes();
        MapBench bench(saved);
        bench.repairMap(disk.path());
        EXPECT_EQ(bench.listener.verdict, "damaged") << saved;
        EXPECT_TRUE(disk.bytes() == damaged) << saved;
    }
}

TEST(PartitionMaps, EachRepairIsUndoneByItself)
{
    const test::TestDirectory workshop;
    const DiskImage disk = DiskImage::gpt(workshop);
    constexpr Task undo{Subject::PartitionMap, Operation::Undo};
    const auto reference = test::wholeDisk(disk.path());
    MapBench bench(workshop.path("saved"));
    disk.fill(512, 512, 0x11);
    const Bytes first = disk.bytes();
    bench.repairMap(disk.path());
    const Bytes repaired = disk.bytes();
    disk.fill(512, 512, 0x22);
    const Bytes second = disk.bytes();
    bench.run(undo, reference);
    EXPECT_EQ(bench.listener.error, contract::kPLErrorNotUndone) << "it was changed since";
    EXPECT_TRUE(disk.bytes() == second);
    bench.repairMap(disk.path());
    for (const Bytes& expected : {second, first}) {
        bench.run(undo, reference);
        EXPECT_TRUE(disk.bytes() == expected) << bench.listener.message;
        disk.put(0, Bytes(repaired.begin(), repaired.begin() + 34 * 512));
    }
    bench.run(undo, reference);
    EXPECT_EQ(bench.listener.error, contract::kPLErrorNothingToUndo);
}

TEST(PartitionMaps, ADiskThatIsInUseIsOnlyRead)
{
    const test::TestDirectory workshop;
    const DiskImage disk = DiskImage::gpt(workshop);
    disk.fill(512, 512, 0);
    const Bytes damaged = disk.bytes();
    const FileDescriptor other(::open(disk.path().c_str(), O_RDWR | O_CLOEXEC));
    ASSERT_EQ(::flock(other.get(), LOCK_SH | LOCK_NB), 0);
    MapBench bench(workshop.path("saved"));
    bench.repairMap(disk.path());
    EXPECT_EQ(bench.listener.error, contract::kPLErrorDiskInUse);
    EXPECT_TRUE(disk.bytes() == damaged);
    bench.verifyMap(disk.path());
    EXPECT_EQ(bench.listener.error, contract::kPLErrorMapDamaged);
}

TEST(PartitionMaps, CapabilityAnswersWithoutAJob)
{
    const test::TestDirectory workshop;
    const MapBench bench(workshop.path("saved"));
    const auto can = [&](const contract::DiskReferencePointer& disk) {
        contract::ErrorCode error = 1;
        return bench.tool->canRepairPartitionMapForDisk(disk, &error) && error == 0;
    };
    const DiskImage gpt = DiskImage::gpt(workshop);
    EXPECT_TRUE(can(test::wholeDisk(gpt.path())));
    EXPECT_FALSE(can(test::reference(gpt.path()))) << "a volume";
    EXPECT_FALSE(can(test::wholeDisk("/dev/zero")));
    EXPECT_FALSE(can(nullptr));
}

}  // namespace
