// SPDX-License-Identifier: Apache-2.0
#include "tests/desktop/WindowFixture.h"

#include "tests/support/LoopDevice.h"
#include "tests/support/TestDirectory.h"

#include <sys/mount.h>

namespace orvane::desktop::test {
namespace {

using orvane::test::LoopDevice;

/// The window with the machine's own disks.
class HotPlugTest : public WindowFixture {
protected:
    void SetUp() override
    {
        if (const char* const obstacle = LoopDevice::obstacle())
            GTEST_SKIP() << obstacle;
    }

    bool isListed(const std::string& device) { return cell(device, DiskColumn::Name) != ""; }
};

TEST_F(HotPlugTest, TheListFollowsADeviceWithoutARescan)
{
    const std::string image = makeImage("plugged");
    openWithSystemDisks();
    LoopDevice device(image);
    ASSERT_TRUE(waitUntil(
        [&] { return cell(device.name(), DiskColumn::Name).starts_with("plugged (loop"); }));

    const std::string mountPoint = directory_ / "mnt";
    std::filesystem::create_directory(mountPoint);
    ASSERT_EQ(::mount(device.name().c_str(), mountPoint.c_str(), "ext4", 0, nullptr), 0);
    EXPECT_TRUE(
        waitUntil([&] { return cell(device.name(), DiskColumn::MountPoint) == mountPoint; }));
    ASSERT_EQ(::umount(mountPoint.c_str()), 0);
    EXPECT_TRUE(waitUntil([&] { return cell(device.name(), DiskColumn::MountPoint).empty(); }));

    run("verifyDiskButton", device.name());
    EXPECT_EQ(verdict(device.name()), "sound");
    device.detach();
    EXPECT_TRUE(waitUntil([&] { return !isListed(device.name()); }));
    EXPECT_TRUE(waitUntil([&] { return !button("verifyDiskButton").isEnabled(); }));
}

// A device that a job has open cannot be detached, so this one only seems to go.
TEST_F(HotPlugTest, ADiskThatGoesDuringItsJobIsListedUntilTheEnd)
{
    useEndlessTool();
    open({});
    const LoopDevice device(makeImage("stick"));
    DiskTree disk;
    disk.facts.identifier = device.name();
    disk.facts.type = diskType::bareVolume;
    disk.facts.storage = contract::DiskReference::Storage::BlockDevice;
    disk.facts.path = disk.facts.identifier;
    disk.facts.length = 8 << 20;
    disk.facts.filesystem = "ext4";
    DiskController& disks = session().host().sharedDiskController();
    disks.synchronize({disk});
    select(disk.facts.identifier);
    button("verifyDiskButton").press();
    ASSERT_TRUE(waitUntil([&] { return logHolds("Verifying"); }));

    disks.synchronize({});
    EXPECT_TRUE(isListed(disk.facts.identifier)) << "the window is locked";
    EXPECT_TRUE(logHolds("Verifying")) << "its log is still to be seen";
    run("verifyDiskButton");
    EXPECT_TRUE(waitUntil([&] { return !isListed(disk.facts.identifier); }));
    EXPECT_FALSE(button("verifyDiskButton").isEnabled());
}

}  // namespace
}  // namespace orvane::desktop::test
