// SPDX-License-Identifier: Apache-2.0
#include "pellar/partitions/MapReport.h"

#include "pellar/bytes/Checksums.h"
#include "pellar/partitions/MapDisk.h"
#include "tests/pellar/partitions/DiskMaker.h"

#include <gtest/gtest.h>

#include <fstream>
#include <functional>

namespace {

using namespace pellar;
using test::DiskImage;
using enum FindingKind;

std::string kindsOf(const MapReport& report)
{
    std::string kinds;
    for (const Finding& finding : report.findings)
        kinds += std::string(textOf(finding.kind)) + "\n";
    return kinds;
}

MapReport reportOf(const std::filesystem::path& image)
{
    return reportOn(glanceAtMap(*test::wholeDisk(image)));
}

struct DamageCase {
    std::function<void(const DiskImage&)> damage;
    MapVerdict verdict;
    std::vector<FindingKind> kinds;  ///< all of them
    std::string_view because;
};

void expectReport(const MapReport& report, const DamageCase& c)
{
    EXPECT_EQ(report.verdict, c.verdict) << c.because << "\n" << kindsOf(report);
    for (const FindingKind kind : c.kinds)
        EXPECT_TRUE(report.has(kind)) << c.because << ": " << textOf(kind) << "\n"
                                      << kindsOf(report);
    EXPECT_EQ(report.findings.size(), c.kinds.size()) << c.because << "\n" << kindsOf(report);
}

// Sector 32767 is the last of 16 MiB; the backup list is in the 32 sectors before it.
constexpr std::uint64_t lastSector = 32767;
constexpr std::uint64_t backupHeader = lastSector * 512;
constexpr std::uint64_t backupEntries = (lastSector - 32) * 512;
constexpr std::uint64_t protective = mbrEntriesOffset;

TEST(Checksum, IsTheOneThatTheStandardMeans)
{
    const std::string_view digits = "123456789";
    EXPECT_EQ(crc32(Bytes(digits.begin(), digits.end())), 0xCBF43926U);
}

TEST(MapReport, TellsWhatIsWrongWithAGPT)
{
    constexpr auto sound = MapVerdict::Sound;
    constexpr auto repairable = MapVerdict::Repairable;
    constexpr auto person = MapVerdict::NeedsPerson;
    const std::vector<DamageCase> cases{
        {[](const DiskImage&) {}, sound, {}, "as the tools made it"},
        {[](const DiskImage& d) { d.fill(512, 512, 0); }, repairable, {PrimaryMissing}, "gone"},
        {[](const DiskImage& d) { d.fill(512, 33 * 512, 0); },
         repairable,
         {PrimaryMissing},
         "with its list"},
        {[](const DiskImage& d) { d.flip(512 + 40); },
         repairable,
         {PrimaryHeaderChecksum},
         "a byte of the header"},
        {[](const DiskImage& d) { d.flip(1024 + 300); },
         repairable,
         {PrimaryEntriesChecksum},
         "a byte of the list"},
        {[](const DiskImage& d) { d.fill(backupHeader, 512, 0); },
         repairable,
         {BackupMissing},
         "backup gone"},
        {[](const DiskImage& d) { d.flip(backupHeader + 40); },
         repairable,
         {BackupHeaderChecksum},
         "a byte of the backup's header"},
        {[](const DiskImage& d) { d.flip(backupEntries + 300); },
         repairable,
         {BackupEntriesChecksum},
         "a byte of the backup's list"},
        {[](const DiskImage& d) {
             d.flip(1024);
             d.flip(backupEntries);
         },
         person,
         {PrimaryEntriesChecksum, BackupEntriesChecksum, NoValidCopy},
         "both lists"},
        {[](const DiskImage& d) {
             d.fill(512, 512, 0);
             d.fill(backupHeader, 512, 0);
         },
         person,
         {PrimaryMissing, BackupMissing, NoValidCopy},
         "only the protective entry tells that there was a map"},
        {[](const DiskImage& d) {
             d.put(backupEntries + 56, Bytes{'X'});
             d.seal(lastSector);
         },
         repairable,
         {CopiesDiffer},
         "another name in the backup, both with right checksums"},
        {[](const DiskImage& d) {
             d.set(512 + 24, 8, 5);
             d.seal(1);
         },
         repairable,
         {PrimaryHeaderNumbers},
         "a header of another sector"},
        {[](const DiskImage& d) { d.resize(24 * test::mebibyte); },
         repairable,
         {BackupNotAtEnd, ProtectiveWrongSize},
         "the disk has grown"},
        {[](const DiskImage& d) {
             d.fill(512, 512, 0);
             d.resize(24 * test::mebibyte);
         },
         repairable,
         {PrimaryMissing, BackupNotAtEnd, ProtectiveWrongSize},
         "and lost its main copy: the protective entry tells where the backup is"},
        {[](const DiskImage& d) { d.resize(14 * test::mebibyte); },
         person,
         {DiskCut, ProtectiveWrongSize},
         "cut behind the last partition"},
        {[](const DiskImage& d) { d.resize(11 * test::mebibyte); },
         person,
         {DiskCut, ProtectiveWrongSize, BeyondDisk},
         "cut inside of it"},
        {[](const DiskImage& d) { d.fill(protective, 66, 0); },
         repairable,
         {ProtectiveMissing},
         "no protective MBR"},
        {[](const DiskImage& d) { d.set(protective + 12, 4, 77); },
         repairable,
         {ProtectiveWrongSize},
         "its size"},
        {[](const DiskImage& d) { d.set(protective + 12, 4, 0xFFFFFFFF); },
         sound,
         {},
         "the greatest size stands for any"},
        {[](const DiskImage& d) { d.set(protective + 8, 4, 7); },
         repairable,
         {ProtectiveWrongStart},
         "its place"},
        {[](const DiskImage& d) { d.fill(protective + 4, 1, 0x83); },
         person,
         {ProtectiveReplaced},
         "an ordinary entry over the whole disk, and both copies good"},
        {[](const DiskImage& d) {
             d.put(protective + 16, Bytes{0, 0, 2, 0, 0x83, 0, 0, 0, 0, 8, 0, 0, 0, 32, 0, 0});
         },
         sound,
         {Hybrid},
         "a hybrid MBR is no damage"},
        {[](const DiskImage& d) { d.setEntry(2, 10000, 14335); },
         person,
         {Overlap, Overlap},
         "into both neighbours"},
        {[](const DiskImage& d) { d.setEntry(2, 24575, 20480); }, person, {EndBeforeStart}, ""},
        {[](const DiskImage& d) { d.setEntry(2, 20480, 40000); }, person, {BeyondDisk}, ""},
        {[](const DiskImage& d) { d.setEntry(2, 20480, 32740); },
         person,
         {OutsideUsable},
         "over the backup list"},
        {[](const DiskImage& d) { d.setEntry(2, 40, 1000); },
         person,
         {OutsideUsable},
         "before the first usable sector"},
        {[](const DiskImage& d) { d.setEntry(2, 20480, ~0ULL); },
         person,
         {BeyondDisk},
         "no overflow"},
        {[](const DiskImage& d) { d.putIntoEntries(128 + 16, d.part(1024 + 16, 16)); },
         person,
         {SameIdentifier},
         "a copied entry"},
    };
    for (const DamageCase& c : cases) {
        const test::Workshop workshop;
        const DiskImage disk = DiskImage::gpt(workshop);
        c.damage(disk);
        expectReport(reportOf(disk.path()), c);
    }
}

TEST(MapReport, TellsWhatIsWrongWithAnMBR)
{
    // Primaries at 2048, 6144 and 23000, an extended one at 10240 with two logical ones in it.
    constexpr std::string_view script =
        "start=2048, size=4096, bootable\nstart=6144, size=4096\nstart=10240, size=12288, type=5\n"
        "start=23000, size=10\nstart=12288, size=2048\nsize=2048\n";
    const auto link = [](const DiskImage& d, int entry, std::size_t offset, std::uint64_t value) {
        d.set(10240 * 512 + mbrEntriesOffset + static_cast<std::size_t>(entry) * 16 + offset, 4,
              value);
    };
    constexpr auto person = MapVerdict::NeedsPerson;
    const std::vector<DamageCase> cases{
        {[](const DiskImage&) {}, MapVerdict::Sound, {}, "as the tools made it"},
        {[](const DiskImage& d) { d.set(446, 1, 0x42); }, person, {BadBootFlag}, ""},
        {[](const DiskImage& d) { d.set(446 + 16, 1, 0x80); }, person, {TwoActive}, ""},
        {[](const DiskImage& d) { d.set(446 + 12, 4, 5000); }, person, {Overlap}, ""},
        {[](const DiskImage& d) { d.set(446 + 32 + 12, 4, 0xFFFFFFF0); },
         person,
         {BeyondDisk, Overlap},
         "no overflow"},
        {[](const DiskImage& d) { d.set(446 + 12, 4, 0); }, person, {EmptyPartition}, ""},
        {[](const DiskImage& d) { d.set(446 + 8, 4, 0); }, person, {StartsAtMap}, ""},
        {[](const DiskImage& d) {
             d.set(446 + 4, 1, 5);
             d.put(2048 * 512 + 510, Bytes{0x55, 0xAA});
         },
         person,
         {SeveralExtended},
         "a second one, without partitions"},
        {[](const DiskImage& d) { d.fill(10240 * 512 + 510, 2, 0); }, person, {ChainBroken}, ""},
        {[&](const DiskImage& d) { link(d, 1, 8, 0); }, person, {ChainLoop}, "back to the start"},
        {[&](const DiskImage& d) { link(d, 1, 8, 20000); }, person, {ChainOutside}, ""},
        {[&](const DiskImage& d) { link(d, 1, 8, 0xFFFFFFFF); }, person, {ChainOutside}, ""},
        {[&](const DiskImage& d) { link(d, 0, 12, 20000); },
         person,
         {OutsideExtended, Overlap},
         "a logical partition that is too long"},
    };
    for (const DamageCase& c : cases) {
        const test::Workshop workshop;
        const DiskImage disk = DiskImage::mbr(workshop, script);
        c.damage(disk);
        expectReport(reportOf(disk.path()), c);
    }
}

TEST(MapReport, NothingThatIsNoMapIsTakenForOne)
{
    const test::Workshop workshop;
    const auto verdictOf = [&](std::string_view name) {
        return reportOf(workshop.path(name)).verdict;
    };
    workshop.write("empty", {});
    workshop.write("short", std::string(700, 'x'));
    workshop.write("zeros", std::string(1 << 20, '\0'));
    workshop.write("text", std::string(1 << 20, 'U'));
    workshop.makeExt("ext4", 8 * test::mebibyte);
    for (const std::string_view name : {"nothing", "empty", "short", "zeros", "text", "ext4"})
        EXPECT_EQ(verdictOf(name), MapVerdict::None) << name;
    if (test::runTool({"mkfs.fat", "-C", workshop.path("fat"), "8192"}).status == 0) {
        EXPECT_EQ(verdictOf("fat"), MapVerdict::None) << "its boot sector looks like an MBR";
    }
}

// The danger: a repairer that restores such a map destroys the file system's start.
TEST(MapReport, AFileSystemInAnOldMapsPlaceIsLeftAlone)
{
    const test::Workshop workshop;
    const DiskImage disk = DiskImage::gpt(workshop);
    const Bytes backup = disk.bytes();
    workshop.makeExt("volume", 16 * test::mebibyte);
    std::filesystem::rename(workshop.path("volume"), disk.path());
    disk.put(backupEntries, ByteView(backup).subspan(backupEntries));
    EXPECT_EQ(reportOf(disk.path()).verdict, MapVerdict::None) << "only the backup is left of it";
    disk.put(0, ByteView(backup).first(512));
    const MapReport report = reportOf(disk.path());
    EXPECT_TRUE(report.verdict == MapVerdict::NeedsPerson && report.has(DiskFilled))
        << kindsOf(report);
}

// A RAID keeps its superblock behind the array's map, which then is not at the end of the disk; the
// mark of an optical disc is easier to make.
TEST(MapReport, WhatFillsTheDiskMayOwnItsEnd)
{
    const test::Workshop workshop;
    const DiskImage disk = DiskImage::gpt(workshop);
    disk.put(32768, Bytes{1, 'C', 'D', '0', '0', '1', 1});
    disk.put(32768 + 2048, Bytes{255, 'C', 'D', '0', '0', '1', 1});
    EXPECT_EQ(reportOf(disk.path()).verdict, MapVerdict::Sound);
    disk.resize(20 * test::mebibyte);
    const MapReport grown = reportOf(disk.path());
    EXPECT_TRUE(grown.verdict == MapVerdict::NeedsPerson && grown.has(DiskFilled))
        << kindsOf(grown);
    disk.resize(16 * test::mebibyte);
    disk.fill(backupHeader, 512, 0);
    const MapReport lost = reportOf(disk.path());
    EXPECT_TRUE(lost.verdict == MapVerdict::NeedsPerson && lost.has(DiskFilled)) << kindsOf(lost);
}

TEST(MapReport, AnOlderGPTUnderAnMBRIsANote)
{
    const test::Workshop workshop;
    const DiskImage disk = DiskImage::gpt(workshop);
    disk.put(protective, Bytes{0, 0, 2, 0, 0x83, 0, 0, 0, 0, 8, 0, 0, 0, 32, 0, 0});
    const MapReport report = reportOf(disk.path());
    EXPECT_TRUE(report.verdict == MapVerdict::Sound && report.has(Remnants)) << kindsOf(report);
}

TEST(MapReport, LargeSectorsAreFoundByThemselves)
{
    const test::Workshop workshop;
    const auto path = workshop.path("large");
    workshop.write("large", {});
    std::filesystem::resize_file(path, 32 * test::mebibyte);
    ASSERT_EQ(test::runTool({"fdisk", "-b", "4096", path}, "g\nn\n\n\n+4M\nn\n\n\n+4M\nw\n").status,
              0);
    const PartitionMap map = glanceAtMap(*test::wholeDisk(path));
    EXPECT_EQ(map.sectorBytes, 4096U);
    EXPECT_EQ(reportOn(map).verdict, MapVerdict::Sound) << kindsOf(reportOn(map));
    std::fstream(path, std::ios::in | std::ios::out | std::ios::binary).seekp(4096) << "12345678";
    const MapReport damaged = reportOf(path);
    EXPECT_TRUE(damaged.verdict == MapVerdict::Repairable && damaged.has(PrimaryMissing))
        << kindsOf(damaged);
}

TEST(MapReport, NamesCannotForgeAnything)
{
    const test::Workshop workshop;
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
TEST(MapReport, ManyFindingsAreCut)
{
    const test::Workshop workshop;
    const DiskImage disk = DiskImage::gpt(workshop);
    const Bytes entry = disk.part(1024, 128);
    Bytes all;
    for (int i = 0; i < 128; ++i)
        all.insert(all.end(), entry.begin(), entry.end());
    disk.putIntoEntries(0, all);
    const MapReport report = reportOf(disk.path());
    EXPECT_EQ(report.verdict, MapVerdict::NeedsPerson);
    EXPECT_LE(report.findings.size(), 51U);
    EXPECT_EQ(report.findings.back().kind, More);
}

}  // namespace
