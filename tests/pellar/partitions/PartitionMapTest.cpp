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
#include <unistd.h>

#include <algorithm>
#include <cstring>
#include <fstream>
#include <map>
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

using Change = std::function<void(const DiskImage&)>;

Change zero(std::uint64_t offset, std::uint64_t length)
{
    return [=](const DiskImage& d) {
        d.fill(offset, length, 0);
    };
}
Change flip(std::uint64_t offset)
{
    return [=](const DiskImage& d) {
        d.flip(offset);
    };
}
Change put(std::uint64_t offset, Bytes bytes)
{
    return [=](const DiskImage& d) {
        d.put(offset, bytes);
    };
}
/// A number, least significant byte first.
Change set(std::uint64_t offset, std::size_t length, std::uint64_t value)
{
    return [=](const DiskImage& d) {
        d.set(offset, length, value);
    };
}
Change resize(std::uint64_t bytes)
{
    return [=](const DiskImage& d) {
        d.resize(bytes);
    };
}
/// In both copies, with right checksums.
Change entry(std::uint32_t number, std::uint64_t first, std::uint64_t last)
{
    return [=](const DiskImage& d) {
        d.setEntry(number, first, last);
    };
}
Change seal(std::uint64_t header)
{
    return [=](const DiskImage& d) {
        d.seal(header);
    };
}

struct DamageCase {
    std::vector<Change> changes;
    MapVerdict verdict;
    std::vector<FindingKind> kinds;  ///< all of them
    std::string_view because;

    void make(const DiskImage& disk) const
    {
        for (const Change& change : changes)
            change(disk);
    }
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
    EXPECT_EQ(report.verdict, c.verdict) << c.because << "\n" << kindsOf(report);
    for (const FindingKind kind : c.kinds)
        EXPECT_TRUE(report.has(kind)) << c.because << ": " << textOf(kind) << "\n"
                                      << kindsOf(report);
    EXPECT_EQ(report.findings.size(), c.kinds.size()) << c.because << "\n" << kindsOf(report);
}

struct MapBench : test::JobFixture {
    explicit MapBench(const fs::path& saved)
        : JobFixture([&] {
              JobOptions options;
              options.savedSectorsDirectory = saved;
              return options;
          }())
    {
    }

    contract::ErrorCode verifyMap(const fs::path& disk)
    {
        return finish(tool->beginPartitionMapVerifyForDisk(test::wholeDisk(disk)));
    }
    contract::ErrorCode repairMap(const fs::path& disk)
    {
        return finish(tool->beginPartitionMapRepairForDisk(test::wholeDisk(disk)));
    }
};

void expectToolsAgree(const fs::path& disk, std::string_view because)
{
    const test::ToolAnswer sfdisk = test::runTool({"sfdisk", "--verify", disk});
    EXPECT_NE(sfdisk.output.find("No errors detected"), std::string::npos)
        << because << sfdisk.output;
    const test::ToolAnswer sgdisk = test::runTool({"sgdisk", "-v", disk});
    if (sgdisk.status >= 0) {
        EXPECT_NE(sgdisk.output.find("No problems found"), std::string::npos)
            << because << sgdisk.output;
    }
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

/// What the files in the one directory below say stood on the disk.
std::map<std::uint64_t, Bytes> savedSectors(const fs::path& saved)
{
    std::map<std::uint64_t, Bytes> sectors;
    for (const auto& file : fs::recursive_directory_iterator(saved)) {
        const std::string name = file.path().filename();
        if (!name.starts_with("sector-"))
            continue;
        sectors[std::stoull(name.substr(7))] = test::fileBytes(file.path());
    }
    return sectors;
}

// As `sh README.txt` would, command by command.
Bytes putBack(Bytes disk, const std::map<std::uint64_t, Bytes>& saved)
{
    for (const auto& [sector, bytes] : saved)
        std::copy(bytes.begin(), bytes.end(),
                  disk.begin() + static_cast<std::ptrdiff_t>(sector * 512));
    return disk;
}

/// Carried out: what is kept, what is written, and what the disk is then.
void expectRepaired(const test::TestDirectory& workshop, MapBench& bench, const DiskImage& disk,
                    const Bytes& before, std::string_view because)
{
    const Bytes damaged = disk.bytes();
    bench.verifyMap(disk.path());
    EXPECT_EQ(bench.listener.error, contract::kPLErrorMapDamaged) << because;
    EXPECT_TRUE(disk.bytes() == damaged) << because << ": a verification has written";
    bench.repairMap(disk.path());
    EXPECT_EQ(bench.listener.verdict, "repaired") << because << bench.listener.message;
    const Bytes after = disk.bytes();
    if (after.size() == before.size()) {
        EXPECT_TRUE(differences(after, before).empty()) << because;
    }
    for (const std::uint64_t sector : differences(after, damaged))
        EXPECT_TRUE(sector <= 33 || sector >= lastSector - 32) << because << ": sector " << sector;
    EXPECT_TRUE(putBack(after, savedSectors(workshop.path("saved"))) == damaged)
        << because << ": what was kept is not what was there";
    expectToolsAgree(disk.path(), because);
    bench.verifyMap(disk.path());
    EXPECT_EQ(bench.listener.verdict, "sound") << because;
}

void expectUntouched(const test::TestDirectory& workshop, MapBench& bench, const DiskImage& disk,
                     std::string_view because)
{
    const Bytes damaged = disk.bytes();
    bench.verifyMap(disk.path());
    EXPECT_EQ(bench.listener.error, contract::kPLErrorMapNeedsPerson) << because;
    bench.repairMap(disk.path());
    EXPECT_EQ(bench.listener.error, contract::kPLErrorMapNotRepaired) << because;
    EXPECT_TRUE(disk.bytes() == damaged) << because;
    EXPECT_FALSE(fs::exists(workshop.path("saved"))) << because << ": nothing to be kept";
}

TEST(PartitionMaps, AGPTIsRestoredWhereItIsThereTwiceAndLeftAloneElsewhere)
{
    const Change lostBackup = zero(backupEntries, 33 * 512);
    const std::vector<DamageCase> cases{
        {{}, sound, {}, "as the tools made it"},
        {{zero(512, 512)}, repairable, {PrimaryMissing}, "gone"},
        {{zero(512, 33 * 512)}, repairable, {PrimaryMissing}, "with its list"},
        {{flip(512 + 40)}, repairable, {PrimaryHeaderChecksum}, "a byte of the header"},
        {{flip(1024 + 300)}, repairable, {PrimaryEntriesChecksum}, "a byte of the list"},
        {{zero(backupHeader, 512)}, repairable, {BackupMissing}, "backup gone"},
        {{lostBackup}, repairable, {BackupMissing}, "with its list"},
        {{flip(backupHeader + 40)}, repairable, {BackupHeaderChecksum}, "the backup's header"},
        {{flip(backupEntries + 300)}, repairable, {BackupEntriesChecksum}, "the backup's list"},
        {{zero(0, 34 * 512)},
         repairable,
         {PrimaryMissing, ProtectiveMissing},
         "all but the backup"},
        {{flip(1024), flip(backupEntries)},
         person,
         {PrimaryEntriesChecksum, BackupEntriesChecksum, NoValidCopy},
         "both lists"},
        {{zero(512, 512), zero(backupHeader, 512)},
         person,
         {PrimaryMissing, BackupMissing, NoValidCopy},
         "only the protective entry tells that there was a map"},
        {{put(backupEntries + 56, {'X'}), seal(lastSector)},
         repairable,
         {CopiesDiffer},
         "another name in the backup, both with right checksums"},
        {{set(512 + 24, 8, 5), seal(1)}, repairable, {PrimaryHeaderNumbers}, "another sector's"},
        {{resize(24 * mebibyte)}, repairable, {BackupNotAtEnd, ProtectiveWrongSize}, "grown"},
        {{resize(16 * mebibyte + 5 * 512)},
         repairable,
         {BackupNotAtEnd, ProtectiveWrongSize},
         "grown by less than a copy takes"},
        {{resize(16 * mebibyte + 5 * 512), zero(512, 512)},
         repairable,
         {PrimaryMissing, BackupNotAtEnd, ProtectiveWrongSize},
         "and lost its main copy: the protective entry tells where the backup is"},
        {{resize(14 * mebibyte)}, person, {DiskCut, ProtectiveWrongSize}, "cut behind the last"},
        {{resize(11 * mebibyte)},
         person,
         {DiskCut, ProtectiveWrongSize, BeyondDisk},
         "cut inside of it"},
        {{zero(protective, 66)}, repairable, {ProtectiveMissing}, "no protective MBR"},
        {{set(protective + 12, 4, 77)}, repairable, {ProtectiveWrongSize}, "its size"},
        {{set(protective + 12, 4, 0xFFFFFFFF)}, sound, {}, "the greatest size stands for any"},
        {{set(protective + 8, 4, 7)}, repairable, {ProtectiveWrongStart}, "its place"},
        {{set(protective + 4, 1, 0x83)},
         person,
         {ProtectiveReplaced},
         "an ordinary entry over the whole disk, and both copies good"},
        {{put(protective + 16, {0, 0, 2, 0, 0x83, 0, 0, 0, 0, 8, 0, 0, 0, 32, 0, 0})},
         sound,
         {Hybrid},
         "a hybrid MBR is no damage"},
        {{entry(2, 10000, 14335)}, person, {Overlap, Overlap}, "into both neighbours"},
        {{entry(2, 10000, 14335), zero(backupHeader, 512)},
         person,
         {Overlap, Overlap, BackupMissing},
         "and a lost backup"},
        {{entry(2, 24575, 20480)}, person, {EndBeforeStart}, ""},
        {{entry(2, 20480, 32768)}, person, {BeyondDisk}, "by one sector"},
        {{entry(2, 20480, 32740)}, person, {OutsideUsable}, "over the backup list"},
        {{entry(2, 40, 1000)}, person, {OutsideUsable}, "before the first usable sector"},
        {{entry(2, 20480, ~0ULL)}, person, {BeyondDisk}, "no overflow"},
        {{[](const DiskImage& d) {
             d.putIntoEntries(128 + 16, d.part(1024 + 16, 16));
         }},
         person,
         {SameIdentifier},
         "a copied entry"},
    };
    for (const DamageCase& c : cases) {
        const test::TestDirectory workshop;
        const DiskImage disk = DiskImage::gpt(workshop);
        const Bytes before = disk.bytes();
        c.make(disk);
        expectReport(disk.path(), c);
        MapBench bench(workshop.path("saved"));
        if (c.verdict == repairable)
            expectRepaired(workshop, bench, disk, before, c.because);
        if (c.verdict == person)
            expectUntouched(workshop, bench, disk, c.because);
    }
}

TEST(PartitionMaps, AnMBRIsOnlyJudged)
{
    // Primaries at 2048, 6144 and 23000, an extended one at 10240 with two logical ones in it.
    constexpr std::string_view script =
        "start=2048, size=4096, bootable\nstart=6144, size=4096\nstart=10240, size=12288, type=5\n"
        "start=23000, size=10\nstart=12288, size=2048\nsize=2048\n";
    const auto link = [](std::uint64_t entry, std::uint64_t offset, std::uint64_t value) {
        return set(10240 * 512 + mbrEntriesOffset + entry * 16 + offset, 4, value);
    };
    const std::vector<DamageCase> cases{
        {{}, sound, {}, "as the tools made it"},
        {{set(446, 1, 0x42)}, person, {BadBootFlag}, ""},
        {{set(446 + 16, 1, 0x80)}, person, {TwoActive}, ""},
        {{set(446 + 12, 4, 5000)}, person, {Overlap}, ""},
        {{set(446 + 32 + 12, 4, 0xFFFFFFF0)}, person, {BeyondDisk, Overlap}, "no overflow"},
        {{set(446 + 12, 4, 0)}, person, {EmptyPartition}, ""},
        {{set(446 + 8, 4, 0)}, person, {StartsAtMap}, ""},
        {{set(446 + 4, 1, 5), put(2048 * 512 + 510, {0x55, 0xAA})},
         person,
         {SeveralExtended},
         "a second one, without partitions"},
        {{zero(10240 * 512 + 510, 2)}, person, {ChainBroken}, ""},
        {{link(1, 8, 0)}, person, {ChainLoop}, "back to the start"},
        {{link(1, 8, 20000)}, person, {ChainOutside}, ""},
        {{link(1, 8, 0xFFFFFFFF)}, person, {ChainOutside}, ""},
        {{link(0, 12, 20000)}, person, {OutsideExtended, Overlap}, "a logical one too long"},
    };
    for (const DamageCase& c : cases) {
        const test::TestDirectory workshop;
        const DiskImage disk = DiskImage::mbr(workshop, script);
        c.make(disk);
        expectReport(disk.path(), c);
    }
}

TEST(PartitionMaps, NothingThatIsNoMapIsTakenForOne)
{
    const test::TestDirectory workshop;
    const auto verdictOf = [&](std::string_view name) {
        return reportOf(workshop.path(name)).verdict;
    };
    workshop.write("empty", {});
    workshop.write("short", std::string(700, 'x'));
    workshop.write("zeros", std::string(1 << 20, '\0'));
    workshop.write("text", std::string(1 << 20, 'U'));
    workshop.makeExt("ext4", 8 * mebibyte);
    for (const std::string_view name : {"nothing", "empty", "short", "zeros", "text", "ext4"})
        EXPECT_EQ(verdictOf(name), MapVerdict::None) << name;
    if (test::runTool({"mkfs.fat", "-C", workshop.path("fat"), "8192"}).status == 0) {
        EXPECT_EQ(verdictOf("fat"), MapVerdict::None) << "its boot sector looks like an MBR";
    }
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

TEST(PartitionMaps, AnOlderGPTUnderAnMBRIsANote)
{
    const test::TestDirectory workshop;
    const DiskImage disk = DiskImage::gpt(workshop);
    disk.put(protective, Bytes{0, 0, 2, 0, 0x83, 0, 0, 0, 0, 8, 0, 0, 0, 32, 0, 0});
    const MapReport report = reportOf(disk.path());
    EXPECT_TRUE(report.verdict == sound && report.has(Remnants)) << kindsOf(report);
}

TEST(PartitionMaps, LargeSectorsAreFoundByThemselves)
{
    const test::TestDirectory workshop;
    const auto path = workshop.path("large");
    workshop.write("large", {});
    fs::resize_file(path, 32 * mebibyte);
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
        EXPECT_EQ(label.find(part), std::string::npos) << label;
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

TEST(PartitionMaps, KeepsTheOldSectorsPrivatelyAndTellsHowToPutThemBack)
{
    const test::TestDirectory workshop;
    const DiskImage disk = DiskImage::gpt(workshop, "it's $HOME\n.img");
    disk.fill(512, 512, 0x11);
    const fs::path saved = workshop.path("saved");
    MapBench bench(saved);
    bench.repairMap(disk.path());
    disk.fill(512, 512, 0x22);
    bench.repairMap(disk.path());
    const auto count = std::distance(fs::directory_iterator(saved), fs::directory_iterator());
    EXPECT_EQ(count, 2) << "a second repair does not overwrite what the first has kept";
    for (const auto& entry : fs::recursive_directory_iterator(saved)) {
        struct stat status = {};
        ASSERT_EQ(::stat(entry.path().c_str(), &status), 0);
        EXPECT_EQ(status.st_mode & 0077, 0U) << entry.path();
    }
    std::ifstream file(fs::directory_iterator(saved)->path() / "README.txt");
    const std::string text(std::istreambuf_iterator<char>(file), {});
    EXPECT_NE(text.find("bs=512 seek=1 conv=notrunc,fsync"), std::string::npos) << text;
    EXPECT_NE(text.find("it'\\''s $HOME"), std::string::npos) << text;
    EXPECT_EQ(text.find("HOME\n"), std::string::npos) << "a line end in a name forges no line";
}

TEST(PartitionMaps, ADiskThatIsInUseIsOnlyRead)
{
    const test::TestDirectory workshop;
    const DiskImage disk = DiskImage::gpt(workshop);
    disk.fill(512, 512, 0);
    const Bytes damaged = disk.bytes();
    const FileDescriptor other(::open(disk.path().c_str(), O_RDWR | O_CLOEXEC));
    ASSERT_EQ(::flock(other.get(), LOCK_EX | LOCK_NB), 0);
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
        const bool answer = bench.tool->canRepairPartitionMapForDisk(disk, &error);
        EXPECT_EQ(error, contract::kPLNoError);
        return answer;
    };
    const DiskImage gpt = DiskImage::gpt(workshop, "gpt");
    EXPECT_TRUE(can(test::wholeDisk(gpt.path())));
    EXPECT_TRUE(can(test::wholeDisk(DiskImage::mbr(workshop, "start=2048\n", "mbr").path())));
    EXPECT_FALSE(can(test::reference(gpt.path()))) << "a volume";
    EXPECT_FALSE(can(test::wholeDisk(workshop.makeExt("ext", 8 * mebibyte))));
    EXPECT_FALSE(can(test::wholeDisk("/dev/zero")));
    EXPECT_FALSE(can(nullptr));
}

}  // namespace
