// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/disks/DiskController.h"
#include "orvane/support/disks/FormatName.h"
#include "orvane/support/images/ImageAttacher.h"
#include "orvane/support/images/ImageFile.h"
#include "orvane/support/loop/Notifications.h"
#include "tests/support/TestDirectory.h"

#include <gtest/gtest.h>

namespace orvane {
namespace {

using test::prepareWith;
using test::TestDirectory;
namespace fs = std::filesystem;

constexpr std::uint64_t mebibyte = 1U << 20U;

void makeExt(const fs::path& image, std::uint64_t offset, std::uint64_t bytes,
             const std::string& label)
{
    prepareWith({"mke2fs", "-q", "-F", "-t", "ext4", "-L", label, "-E",
                 "offset=" + std::to_string(offset), image.native(),
                 std::to_string(bytes / 1024) + "k"});
}

DiskTree disksIn(const fs::path& image)
{
    const auto opened = openImage(image, Translator());
    if (!opened) {
        ADD_FAILURE() << opened.error().message;
        return {};
    }
    return disksOfImage(*opened, readContents(*opened));
}

std::string outline(const DiskTree& tree)
{
    const DiskFacts& facts = tree.facts;
    std::string text = std::to_string(facts.number) + ":type" + std::to_string(facts.type) + ":" +
                       facts.filesystem + (facts.isShown ? "" : ":hidden");
    for (const DiskTree& child : tree.children)
        text += " " + outline(child);
    return text;
}

TEST(ImageDisks, ABareFileSystemIsOneVolume)
{
    const TestDirectory directory;
    const fs::path image = directory.makeFile("disk.img", 8 * mebibyte);
    makeExt(image, 0, 8 * mebibyte, "B\x1b[31m\xff%s");
    const DiskTree disk = disksIn(image);
    EXPECT_EQ(outline(disk), "0:type6:ext4");
    EXPECT_EQ(disk.facts.name, "B\x1b[31m\xff%s") << "a label is any bytes";

    const fs::path larger = directory.makeFile("disk.img", 32 * mebibyte);
    EXPECT_EQ(outline(disksIn(larger)), "0:type6:") << "unknown contents are still a volume";
    makeExt(larger, 0, 32 * mebibyte, "X");
    test::patch(larger, 1024, std::string(1024, '\0'));
    EXPECT_EQ(outline(disksIn(larger)), "0:type6:ext4") << "known by the superblock's backup";
}

TEST(ImageDisks, FormatsAreCalledAsPeopleCallThem)
{
    const TestDirectory directory;
    const fs::path image = directory.makeFile("disk.img", 64 * mebibyte);
    const auto format = [&] {
        const DiskFacts facts = disksIn(image).facts;
        return formatName(facts.filesystem, facts.filesystemVersion);
    };
    struct FAT {
        const char* bits;
        const char* sectorsPerCluster;
        const char* name;
    };
    for (const FAT& fat :
         {FAT{"12", "64", "FAT12"}, FAT{"16", "8", "FAT16"}, FAT{"32", "1", "FAT32"}}) {
        prepareWith({"mkfs.fat", "-s", fat.sectorsPerCluster, "-F", fat.bits, image.native()});
        EXPECT_EQ(format(), fat.name);
    }
    makeExt(image, 0, 64 * mebibyte, "");
    EXPECT_EQ(format(), "ext4");
    EXPECT_EQ(formatName("vfat", ""), "FAT") << "an entry of udev may lack the version";
    EXPECT_EQ(formatName("vfat", "\x1b[31m"), "FAT");
    EXPECT_EQ(formatName("ntfs", "3.1"), "NTFS");
    EXPECT_EQ(formatName("zfs\xff", ""), "zfs\xff") << "what is not known stays as it is";
}

TEST(ImageDisks, PartitionsOfAGPT)
{
    const TestDirectory directory;
    const fs::path image = directory.makeFile("disk.img", 64 * mebibyte);
    prepareWith({"sfdisk", "-q", image.native()},
                "label: gpt\n"
                "start=2048, size=32768, type=linux\n"
                "size=16384, type=swap\n"
                "size=16384, type=linux\n"
                "size=16384, type=E6D6D379-F507-44C2-A23C-238F2A3DF928\n");
    makeExt(image, mebibyte, 16 * mebibyte, "");
    const DiskTree disk = disksIn(image);
    EXPECT_EQ(outline(disk), "0:type1: 1:type3:ext4 2:type3::hidden 3:type3: 4:type3::hidden")
        << "a Linux partition without a file system may be a damaged one";
    ASSERT_EQ(disk.children.size(), 4U);
    EXPECT_EQ(disk.facts.partitionMap, "gpt");
    EXPECT_EQ(disk.children[0].facts.offset, mebibyte);
    EXPECT_EQ(disk.children[0].facts.length, 16 * mebibyte);
    EXPECT_EQ(disk.children[0].facts.identifier, image.native() + "#1");

    fs::resize_file(image, 20 * mebibyte);
    EXPECT_TRUE(disksIn(image).facts.isWhole) << "cut short, it is still a partitioned disk";
    test::patch(image, 512, std::string(512, 'x'));
    EXPECT_TRUE(disksIn(image).facts.isWhole) << "and with a destroyed header, too";
}

TEST(ImageDisks, LogicalPartitionsOfAnMBRAndOneBeyondTheEnd)
{
    const TestDirectory directory;
    const fs::path image = directory.makeFile("disk.img", 64 * mebibyte);
    prepareWith({"sfdisk", "-q", image.native()},
                "label: dos\n"
                "start=2048, size=16384, type=83\n"
                "start=20480, size=65536, type=5\n"
                "start=22528, size=16384, type=83\n"
                "start=43008, size=16384, type=82\n");
    const std::string expected = "0:type1: 1:type3: 2:type2::hidden 5:type3:";
    EXPECT_EQ(outline(disksIn(image)).substr(0, expected.size()), expected)
        << "the extended partition is a container";
    fs::resize_file(image, 15 * mebibyte);
    const DiskTree cut = disksIn(image);
    ASSERT_GE(cut.children.size(), 3U);
    EXPECT_EQ(cut.children[2].facts.length, 8 * mebibyte) << "what the map states, to be reported";
}

TEST(ImageAttacher, TheWayOfAnImageThroughTheHost)
{
    const TestDirectory directory;
    const fs::path image = directory.makeFile("disk.img", 8 * mebibyte);
    makeExt(image, 0, 8 * mebibyte, "Data");
    Notifications center;
    DiskController controller(center, {});
    const auto offline = controller.add(factsOfImage(*openImage(image, Translator())));
    ImageAttacher attacher({}, Translator());
    contract::Dictionary result;
    contract::OVDiskPointer top;
    std::thread worker([&] {
        ASSERT_EQ(attacher.AttachImageWithURL(image, result), 0);
        top = attacher.TopLevelPLDiskForImageDict(result);
    });
    worker.join();
    ASSERT_NE(top, nullptr);
    ASSERT_EQ(controller.viewablePartitions(top).size(), 1U);
    EXPECT_EQ(controller.diskWithKRDisk(top->theKRDisk()), top) << "known once it was asked for";

    top->fsckHistoryNoChildren().append(contract::Dictionary::make());
    controller.ejectDisk(top, true);
    EXPECT_EQ(controller.diskWithIdentifier(top->diskIdentifier()), nullptr);
    EXPECT_EQ(offline->fsckHistory().size(), 1U) << "the image still shows what was found in it";
}

TEST(ImageAttacher, AFailureIsACodeWithASentence)
{
    const TestDirectory directory;
    test::write(directory / "x\x1b.img", "");
    test::write(directory / "notes.txt", "Grüße\n");
    ImageAttacher attacher({}, Translator());
    for (const auto& [name, sentence] :
         {std::pair("x\x1b.img", "cannot attach ‘x\uFFFD.img’: the file is empty"),
          {"notes.txt", "cannot attach ‘notes.txt’: it is a text file, not a disk image"}}) {
        contract::Dictionary result;
        EXPECT_EQ(attacher.AttachImageWithURL(directory / name, result),
                  contract::kPLErrorCannotOpen);
        EXPECT_EQ(attacher.lastError(directory / name), sentence);
    }
}

}  // namespace
}  // namespace orvane
