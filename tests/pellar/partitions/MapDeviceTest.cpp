// SPDX-License-Identifier: Apache-2.0
#include "contract/pellar/ErrorCodes.h"
#include "tests/pellar/partitions/DiskMaker.h"
#include "tests/support/LoopDevice.h"

#include <gtest/gtest.h>
#include <unistd.h>

namespace {

using namespace pellar;
using test::DiskImage;

// The kernel here may know no partition tables, so partx(8) adds the partition.
TEST(MapDevice, IsRepairedUnlessAPartitionIsMounted)
{
    if (const char* const obstacle = orvane::test::LoopDevice::obstacle())
        GTEST_SKIP() << obstacle;
    const test::TestDirectory workshop;
    const DiskImage disk = DiskImage::gpt(workshop);
    const Bytes sound = [&] {
        workshop.makeExt("volume", 4 * test::mebibyte);
        disk.put(2048 * 512, test::fileBytes(workshop.path("volume")));
        return disk.bytes();
    }();
    disk.fill(512, 512, 0);
    const orvane::test::LoopDevice device(disk.path());
    auto reference = std::make_shared<contract::DiskReference>(*test::wholeDisk(device.name()));
    reference->storage = contract::DiskReference::Storage::BlockDevice;
    reference->length = 0;
    test::JobFixture bench(test::with(&JobOptions::savedSectorsDirectory, workshop.path("saved")));

    if (test::runTool({"partx", "-a", "--nr", "1", device.name()}).status == 0) {
        std::filesystem::create_directory(workshop.path("mount"));
        if (test::runTool({"mount", device.name() + "p1", workshop.path("mount")}).status == 0) {
            bench.finish(bench.tool->beginPartitionMapRepairForDisk(reference));
            EXPECT_EQ(bench.listener.error, contract::kPLErrorDiskInUse) << bench.listener.message;
            bench.finish(bench.tool->beginPartitionMapVerifyForDisk(reference));
            EXPECT_EQ(bench.listener.error, contract::kPLErrorMapDamaged) << bench.listener.message;
            test::runTool({"umount", workshop.path("mount")});
        } else {
            ADD_FAILURE() << "a partition could not be mounted, so its use is not tested";
        }
    }
    bench.finish(bench.tool->beginPartitionMapRepairForDisk(reference));
    EXPECT_EQ(bench.listener.verdict, "repaired") << bench.listener.message;
    bench.finish(bench.tool->beginPartitionMapVerifyForDisk(reference));
    EXPECT_EQ(bench.listener.verdict, "sound") << bench.listener.message;
    // The device manager may have the partition open for a moment, and a partition that stays would
    // be found on whatever the device is used for next.
    for (int i = 0; i < 50 && test::runTool({"partx", "-d", device.name()}).status != 0; ++i)
        ::usleep(100'000);
    const Bytes after = disk.bytes();
    EXPECT_TRUE(std::equal(after.begin(), after.begin() + 34 * 512, sound.begin()));
}

}  // namespace
