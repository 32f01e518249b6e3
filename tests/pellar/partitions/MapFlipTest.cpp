// SPDX-License-Identifier: Apache-2.0
#include "pellar/bytes/Checksums.h"
#include "pellar/partitions/MapReport.h"
#include "pellar/partitions/RepairPlan.h"
#include "tests/pellar/partitions/DiskMaker.h"

#include <gtest/gtest.h>

#include <random>

namespace {

using namespace pellar;
using test::DiskImage;

/// A disk in memory.
class MemorySectors final : public Sectors {
public:
    explicit MemorySectors(Bytes disk) : bytes(std::move(disk)) {}

    std::uint32_t sectorBytes() const override { return 512; }
    std::uint64_t count() const override { return bytes.size() / 512; }
    std::optional<Bytes> read(std::uint64_t first, std::uint64_t number) const override
    {
        if (!isOnDisk(first, number, count()))
            return std::nullopt;
        const auto begin = bytes.begin() + static_cast<std::ptrdiff_t>(first * sectorBytes());
        return Bytes(begin, begin + static_cast<std::ptrdiff_t>(number * sectorBytes()));
    }

    Bytes bytes;
};

MapReport reportOf(const MemorySectors& disk)
{
    return reportOn(readPartitionMap(disk, {}));
}

/// What the plan would make of the disk; the disk itself when there is none.
Bytes repaired(const MemorySectors& disk)
{
    const PartitionMap map = readPartitionMap(disk, {});
    const auto plan = planRepair(map, reportOn(map), disk);
    Bytes bytes = disk.bytes;
    if (plan)
        for (const SectorWrite& write : plan->writes)
            std::copy(write.after.begin(), write.after.end(),
                      bytes.begin() + static_cast<std::ptrdiff_t>(write.first * 512));
    return bytes;
}

/// Gives a header the right checksum for what stands in it.
void sealHeader(std::span<std::uint8_t> sector)
{
    const std::uint64_t length = littleEndian(sector, 12, 4);
    putLittleEndian(sector, 16, 4, 0);
    if (length <= sector.size())
        putLittleEndian(sector, 16, 4, crc32(sector.first(length)));
}

// Each byte of a header and of a list is covered by a checksum, in either copy.
TEST(MapFlips, EveryByteUnderAChecksumIsMissedAndComesBack)
{
    const test::TestDirectory workshop;
    const Bytes sound = DiskImage::smallGPT(workshop).bytes();
    MemorySectors disk(sound);
    const std::size_t last = (disk.count() - 1) * 512;
    const std::size_t list = 128UL * 128;
    // The lists are mostly zeros; a stride that shares no factor with anything visits all columns.
    for (const auto& [begin, length, step] : {std::tuple(512UL, 92UL, 1UL),
                                              {last, 92UL, 1UL},
                                              {1024UL, 3 * 128UL, 1UL},
                                              {1024UL, list, 101UL},
                                              {last - list, list, 101UL}}) {
        for (std::size_t at = begin; at < begin + length; at += step) {
            disk.bytes[at] ^= 0xFFU;
            const MapReport report = reportOf(disk);
            EXPECT_EQ(report.verdict, MapVerdict::Repairable) << "byte " << at;
            EXPECT_TRUE(repaired(disk) == sound) << "byte " << at;
            disk.bytes[at] = sound[at];
        }
    }
}

TEST(MapFlips, EveryByteOfTheProtectiveEntryIsSurvived)
{
    const test::TestDirectory workshop;
    const Bytes sound = DiskImage::smallGPT(workshop).bytes();
    MemorySectors disk(sound);
    for (std::size_t at = 0; at < 512; ++at) {
        for (const std::uint8_t mask : {0x01U, 0x80U, 0xFFU}) {
            disk.bytes[at] ^= mask;
            const Bytes after = repaired(disk);
            EXPECT_TRUE(std::equal(after.begin() + 512, after.end(), sound.begin() + 512)) << at;
            disk.bytes[at] = sound[at];
        }
    }
}

// Numbers that a checksum blesses are not believed either: whatever stands in a header, nothing is
// read or written out of place. A wrong step here is found by the sanitizers too.
TEST(MapFlips, HostileNumbersInSealedHeadersDoNoHarm)
{
    constexpr std::uint64_t values[] = {
        0, 1, 2, 34, 478, 511, 512, 0x7FFFFFFF, 0xFFFFFFFF, 1ULL << 62U, 1ULL << 63U, ~0ULL};
    const test::TestDirectory workshop;
    const Bytes sound = DiskImage::smallGPT(workshop).bytes();
    const std::size_t last = sound.size() - 512;
    for (const std::size_t header : {std::size_t{512}, last}) {
        for (const std::size_t field : {12U, 24U, 32U, 40U, 48U, 72U, 80U, 84U}) {
            for (const std::uint64_t value : values) {
                MemorySectors disk(sound);
                const std::span sector = std::span(disk.bytes).subspan(header, 512);
                putLittleEndian(sector, field, field == 12 || field >= 80 ? 4 : 8, value);
                sealHeader(sector);
                const Bytes after = repaired(disk);
                EXPECT_TRUE(std::equal(sound.begin() + 64 * 512, sound.begin() + 320 * 512,
                                       after.begin() + 64 * 512))
                    << "field " << field << ", value " << value;
            }
        }
    }
}

// A disk of noise behind the right signatures: nothing crashes, nothing is sound.
TEST(MapFlips, NoiseIsNeverSound)
{
    std::mt19937 random(7);
    MemorySectors disk(Bytes(256 * 512));
    for (int round = 0; round < 300; ++round) {
        for (std::uint8_t& byte : disk.bytes)
            byte = static_cast<std::uint8_t>(random());
        disk.bytes[510] = 0x55;
        disk.bytes[511] = 0xAA;
        const std::string_view signature = "EFI PART";
        std::copy(signature.begin(), signature.end(), disk.bytes.begin() + 512);
        const MapReport report = reportOf(disk);
        EXPECT_NE(report.verdict, MapVerdict::Sound);
        EXPECT_TRUE(repaired(disk) == disk.bytes);
    }
}

}  // namespace
