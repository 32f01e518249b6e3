// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/udisks/DirectDisks.h"
#include "orvane/support/udisks/UDisks.h"
#include "tests/desktop/WindowFixture.h"
#include "tests/support/LoopDevice.h"
#include "tests/support/TestDirectory.h"

#include <QMenu>

#include <fstream>

namespace orvane::desktop::test {
namespace {

using orvane::test::LoopDevice;

/// The window with the machine's own disks and its UDisks2, and a loop device among them.
class VolumeTest : public WindowFixture {
protected:
    ~VolumeTest() override
    {
        if (device_ && !placesOf(device_->name()).empty())
            orvane::test::runTool({"umount", device_->name()});
    }
    void SetUp() override
    {
        if (const char* const obstacle = LoopDevice::obstacle())
            GTEST_SKIP() << obstacle;
        device_ = std::make_unique<LoopDevice>(makeImage("volume"));
        if (asked() == Refusal::Kind::NoService)
            GTEST_SKIP() << "no UDisks2 runs here";
        ASSERT_TRUE(waitUntil([&] { return asked() == Refusal::Kind::AlreadySo; }));
        openWithSystemDisks();
        ASSERT_TRUE(waitUntil(
            [&] { return cell(device_->name(), DiskColumn::Name).starts_with("volume ("); }));
        select(device_->name());
    }

    /// What UDisks2 says to a device that is not mounted: known, or not yet.
    Refusal::Kind asked() const { return UDisks().unmount(device_->name()).error().kind; }
    std::string mountPoint() { return cell(device_->name(), DiskColumn::MountPoint); }
    /// The commands for volumes that the open menu offers, by their first letters.
    std::string offered()
    {
        auto* const menu = qobject_cast<QMenu*>(command("mount").parent());
        emit menu->aboutToShow();
        std::string letters;
        for (const char* const name : {"mount", "unmount", "eject"})
            if (command(name).isEnabled())
                letters += *name;
        return letters;
    }

    std::unique_ptr<LoopDevice> device_;
};

using SystemDisksTest = WindowFixture;

TEST_F(SystemDisksTest, TheListFollowsADeviceWithoutARescan)
{
    if (const char* const obstacle = LoopDevice::obstacle())
        GTEST_SKIP() << obstacle;
    const std::string image = makeImage("plugged");
    openWithSystemDisks();
    LoopDevice device(image);
    ASSERT_TRUE(waitUntil(
        [&] { return cell(device.name(), DiskColumn::Name).starts_with("plugged (loop"); }));

    run("verifyDiskButton", device.name());
    EXPECT_EQ(verdict(device.name()), "sound");
    device.detach();
    EXPECT_TRUE(waitUntil([&] { return cell(device.name(), DiskColumn::Name).empty(); }));
    EXPECT_TRUE(waitUntil([&] { return !button("verifyDiskButton").isEnabled(); }));
}

TEST_F(VolumeTest, AVolumeIsMountedUnmountedAndEjectedFromTheMenu)
{
    EXPECT_EQ(offered(), "me");
    command("mount").trigger();
    EXPECT_EQ(offered(), "") << "it is under way";
    ASSERT_TRUE(waitUntil([&] { return !mountPoint().empty(); }));
    ASSERT_TRUE(waitUntil([&] { return offered() == "ue"; }));
    {
        const std::ofstream file(mountPoint() + "/file");
        command("unmount").trigger();
        ASSERT_TRUE(waitUntil([&] { return sheet() != nullptr; }));
        EXPECT_NE(takeSheet().find("cannot unmount “volume”: it is in use by "), std::string::npos);
    }
    EXPECT_FALSE(mountPoint().empty());
    command("eject").trigger();
    EXPECT_TRUE(waitUntil([&] { return cell(device_->name(), DiskColumn::Name).empty(); }));
    EXPECT_EQ(offered(), "");
    EXPECT_EQ(sheet(), nullptr);
    device_->forget();
}

}  // namespace
}  // namespace orvane::desktop::test
