// SPDX-License-Identifier: Apache-2.0
#include "contract/pellar/ErrorCodes.h"
#include "pellar/partitions/MapDisk.h"
#include "pellar/partitions/MapReport.h"
#include "pellar/process/FileDescriptor.h"
#include "tests/pellar/partitions/DiskMaker.h"

#include <gtest/gtest.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <fcntl.h>
#include <algorithm>
#include <cstring>
#include <fstream>
#include <functional>
#include <map>
#include <set>

namespace {

using namespace pellar;
using test::DiskImage;
namespace fs = std::filesystem;

constexpr std::uint64_t lastSector = 32767;

struct MapBench : test::Bench {
    explicit MapBench(const fs::path& saved)
        : Bench([&] {
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

TEST(MapRepair, RestoresWhatIsThereTwiceAndNothingElse)
{
    struct Case {
        std::string_view because;
        std::function<void(const DiskImage&)> damage;
        bool comesBackAsItWas = true;
    };
    const std::vector<Case> cases{
        {"primary header",
         [](const DiskImage& d) {
             d.fill(512, 512, 0);
         }},
        {"primary copy",
         [](const DiskImage& d) {
             d.fill(512, 33 * 512, 0xAA);
         }},
        {"primary list",
         [](const DiskImage& d) {
             d.flip(1024 + 40);
         }},
        {"backup copy",
         [](const DiskImage& d) {
             d.fill((lastSector - 32) * 512, 33 * 512, 0);
         }},
        {"backup list",
         [](const DiskImage& d) {
             d.flip((lastSector - 32) * 512 + 40);
         }},
        {"copies differ",
         [](const DiskImage& d) {
             d.put((lastSector - 32) * 512 + 56, Bytes{'X'});
             d.seal(lastSector);
         }},
        {"no protective MBR",
         [](const DiskImage& d) {
             d.fill(446, 66, 0);
         }},
        {"everything but the backup",
         [](const DiskImage& d) {
             d.fill(0, 34 * 512, 0);
         }},
        {"grown", [](const DiskImage& d) { d.resize(20 * test::mebibyte); }, false},
        {"grown by less than a copy takes",
         [](const DiskImage& d) { d.resize(16 * test::mebibyte + 5 * 512); }, false},
        {"grown, and lost its main copy",
         [](const DiskImage& d) {
             d.resize(16 * test::mebibyte + 5 * 512);
             d.fill(512, 512, 0);
         },
         false},
    };
    for (const Case& c : cases) {
        const test::Workshop workshop;
        const DiskImage disk = DiskImage::gpt(workshop);
        const Bytes sound = disk.bytes();
        c.damage(disk);
        const Bytes damaged = disk.bytes();
        MapBench bench(workshop.path("saved"));
        ASSERT_EQ(bench.verifyMap(disk.path()), contract::kPLNoError);
        EXPECT_EQ(bench.listener.error, contract::kPLErrorMapDamaged) << c.because;
        EXPECT_TRUE(disk.bytes() == damaged) << c.because << ": a verification has written";
        ASSERT_EQ(bench.repairMap(disk.path()), contract::kPLNoError);
        EXPECT_EQ(bench.listener.verdict, "repaired") << c.because << bench.listener.message;

        const Bytes after = disk.bytes();
        if (c.comesBackAsItWas) {
            EXPECT_TRUE(differences(after, sound).empty()) << c.because;
        }
        for (const std::uint64_t sector : differences(after, damaged))
            EXPECT_TRUE(sector <= 33 || sector >= lastSector - 32)
                << c.because << ": wrote sector " << sector;
        EXPECT_TRUE(putBack(after, savedSectors(workshop.path("saved"))) == damaged)
            << c.because << ": what was kept is not what was there";
        expectToolsAgree(disk.path(), c.because);
        bench.verifyMap(disk.path());
        EXPECT_EQ(bench.listener.verdict, "sound") << c.because;
    }
}

TEST(MapRepair, LargeSectorsToo)
{
    const test::Workshop workshop;
    const auto path = workshop.path("large");
    workshop.write("large", {});
    fs::resize_file(path, 32 * test::mebibyte);
    ASSERT_EQ(test::runTool({"fdisk", "-b", "4096", path}, "g\nn\n\n\n+4M\nw\n").status, 0);
    const Bytes sound = test::fileBytes(path);
    std::fstream(path, std::ios::in | std::ios::out | std::ios::binary).seekp(4096 + 30) << "12";
    MapBench bench(workshop.path("saved"));
    bench.repairMap(path);
    EXPECT_EQ(bench.listener.verdict, "repaired") << bench.listener.message;
    EXPECT_TRUE(test::fileBytes(path) == sound);
}

TEST(MapRepair, TouchesNothingThatAPersonHasToDecide)
{
    struct Case {
        std::string_view because;
        std::function<void(const DiskImage&)> damage;
    };
    const std::vector<Case> cases{
        {"both lists",
         [](const DiskImage& d) {
             d.flip(1024);
             d.flip((lastSector - 32) * 512);
         }},
        {"both headers",
         [](const DiskImage& d) {
             d.fill(512, 512, 0);
             d.fill(lastSector * 512, 512, 0);
         }},
        {"overlap, and a lost backup",
         [](const DiskImage& d) {
             d.setEntry(2, 10000, 14335);
             d.fill(lastSector * 512, 512, 0);
         }},
        {"end before start",
         [](const DiskImage& d) {
             d.setEntry(2, 24575, 20480);
         }},
        {"cut",
         [](const DiskImage& d) {
             d.resize(14 * test::mebibyte);
         }},
    };
    for (const Case& c : cases) {
        const test::Workshop workshop;
        const DiskImage disk = DiskImage::gpt(workshop);
        c.damage(disk);
        const Bytes damaged = disk.bytes();
        MapBench bench(workshop.path("saved"));
        bench.verifyMap(disk.path());
        EXPECT_EQ(bench.listener.error, contract::kPLErrorMapNeedsPerson) << c.because;
        bench.repairMap(disk.path());
        EXPECT_EQ(bench.listener.error, contract::kPLErrorMapNotRepaired) << c.because;
        EXPECT_TRUE(disk.bytes() == damaged) << c.because;
        EXPECT_FALSE(fs::exists(workshop.path("saved"))) << c.because << ": nothing to be kept";
    }
}

// Some boards start from sector 2 and have their list of partitions behind their loader.
TEST(MapRepair, AListBehindALoaderIsFoundAndTheLoaderLeft)
{
    const test::Workshop workshop;
    const DiskImage disk = DiskImage::gpt(workshop);
    if (test::runTool({"sgdisk", "-j", "1000", disk.path()}).status != 0)
        GTEST_SKIP() << "sgdisk is not installed";
    disk.fill(1024, 900 * 512, 0x42);
    const Bytes sound = disk.bytes();
    disk.fill(512, 512, 0);
    MapBench bench(workshop.path("saved"));
    bench.repairMap(disk.path());
    EXPECT_EQ(bench.listener.verdict, "repaired") << bench.listener.message;
    EXPECT_TRUE(differences(disk.bytes(), sound).empty());
}

TEST(MapRepair, WithoutAPlaceForTheOldSectorsNothingIsWritten)
{
    const test::Workshop workshop;
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

TEST(MapRepair, KeepsTheOldSectorsPrivatelyAndTellsHowToPutThemBack)
{
    const test::Workshop workshop;
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

TEST(MapRepair, ADiskThatIsInUseIsOnlyRead)
{
    const test::Workshop workshop;
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

TEST(MapRepair, CapabilityAnswersWithoutAJob)
{
    const test::Workshop workshop;
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
    EXPECT_FALSE(can(test::wholeDisk(workshop.makeExt("ext", 8 * test::mebibyte))));
    EXPECT_FALSE(can(test::wholeDisk("/dev/zero")));
    EXPECT_FALSE(can(nullptr));
}

}  // namespace
