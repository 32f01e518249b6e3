// SPDX-License-Identifier: Apache-2.0
#include "tests/desktop/WindowFixture.h"

#include "orvane/desktop/toolkit/Text.h"
#include "tests/support/LoopDevice.h"
#include "tests/support/ToolRun.h"

#include <sys/mount.h>
#include <unistd.h>

namespace orvane::desktop::test {
namespace {

using orvane::test::LoopDevice;

/// The window with the machine's own disks.
class HotPlugTest : public WindowFixture {
protected:
    void openWithSystemDisks(const std::vector<std::string>& names = {})
    {
        SessionOptions options;
        options.paths = {directory_ / "config", directory_ / "state", directory_ / "cache",
                         directory_ / "data"};
        options.disksToOpen = names;
        session_ = std::make_unique<DesktopSession>(std::move(options));
        session_->show();
        bool isOpen = false;
        session_->host().mainRunLoop().post([&] { isOpen = true; });
        ASSERT_TRUE(waitUntil([&] { return isOpen; }));
    }

    bool isListed(const std::string& device) { return cell(device, DiskColumn::Name) != ""; }
};

TEST_F(HotPlugTest, TheListFollowsADeviceWithoutARescan)
{
    if (const char* const obstacle = LoopDevice::obstacle())
        GTEST_SKIP() << obstacle;
    const std::string image = makeImage("plugged");
    openWithSystemDisks();
    LoopDevice device(image);
    if (device.name().empty())
        GTEST_SKIP() << "no loop device can be set up here";
    ASSERT_TRUE(waitUntil(
        [&] { return cell(device.name(), DiskColumn::Name).starts_with("plugged (loop"); }));
    takePicture("plugged-in");

    const std::string mountPoint = directory_ / "mnt";
    std::filesystem::create_directory(mountPoint);
    ASSERT_EQ(::mount(device.name().c_str(), mountPoint.c_str(), "ext4", 0, nullptr), 0);
    EXPECT_TRUE(
        waitUntil([&] { return cell(device.name(), DiskColumn::MountPoint) == mountPoint; }));
    ASSERT_EQ(::umount(mountPoint.c_str()), 0);
    EXPECT_TRUE(waitUntil([&] { return cell(device.name(), DiskColumn::MountPoint).empty(); }));

    select(device.name());
    EXPECT_TRUE(button("verifyDiskButton").isEnabled());
    button("verifyDiskButton").press();
    ASSERT_TRUE(waitForJob());
    EXPECT_EQ(cell(device.name(), DiskColumn::Verdict), "sound");
    device.detach();
    EXPECT_TRUE(waitUntil([&] { return !isListed(device.name()); }));
    EXPECT_TRUE(waitUntil([&] { return !button("verifyDiskButton").isEnabled(); }));
}

TEST_F(HotPlugTest, ADeviceCanBeNamedByItsNodeAndByItsLabel)
{
    if (const char* const obstacle = LoopDevice::obstacle())
        GTEST_SKIP() << obstacle;
    const LoopDevice device(makeImage("named"));
    if (device.name().empty())
        GTEST_SKIP() << "no loop device can be set up here";
    for (const std::string& name : {device.name(), std::string("LABEL=named")}) {
        openWithSystemDisks({name});
        EXPECT_TRUE(waitUntil([&] { return !window().disks().selectedDisks().empty(); })) << name;
        ASSERT_FALSE(window().disks().selectedDisks().empty());
        EXPECT_EQ(window().disks().selectedDisks().front()->diskIdentifier(), device.name());
        EXPECT_EQ(sheet(), nullptr) << name;
        close();
    }
}

TEST_F(HotPlugTest, TheEmptyLogSaysWhyNothingCanBeDone)
{
    open({});
    DiskTree disk;
    disk.facts.identifier = "/dev/none";
    disk.facts.type = diskType::bareVolume;
    disk.facts.storage = contract::DiskReference::Storage::BlockDevice;
    disk.facts.filesystem = "ext4";
    const EmptyNote* const note = session().activeTab()->interface()->emptyNote();
    ASSERT_NE(note, nullptr);
    struct Case {
        bool isBootVolume;
        std::string_view said;
    };
    for (const Case& c : {Case{true, "rescue system"}, Case{false, "no history"}}) {
        disk.facts.isBootVolume = c.isBootVolume;
        session().host().sharedDiskController().synchronize({});
        session().host().sharedDiskController().synchronize({disk});
        select(disk.facts.identifier);
        EXPECT_NE(fromQt(note->text()).find(c.said), std::string::npos) << fromQt(note->text());
        const QtButton& verify = button("verifyDiskButton");
        EXPECT_NE(verify.isEnabled(), c.isBootVolume);
        EXPECT_TRUE(!c.isBootVolume || waitUntil([&] {
            return fromQt(verify.widget().toolTip()).find(c.said) != std::string::npos;
        })) << "also where a history stands in the log's place";
    }
}

// A device that a job has open cannot be detached, so this one only seems to go.
TEST_F(HotPlugTest, ADiskThatGoesDuringItsJobIsListedUntilTheEnd)
{
    if (const char* const obstacle = orvane::test::LoopDevice::obstacle())
        GTEST_SKIP() << obstacle;
    useEndlessTool();
    open({});
    const orvane::test::LoopDevice device(makeImage("stick"));
    DiskTree disk;
    disk.facts.identifier = device.name();
    disk.facts.name = "stick";
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
    EXPECT_EQ(button("verifyDiskButton").title(), "Stop Verify");
    button("verifyDiskButton").press();
    ASSERT_TRUE(waitForJob());
    EXPECT_TRUE(waitUntil([&] { return !isListed(disk.facts.identifier); }));
    EXPECT_FALSE(button("verifyDiskButton").isEnabled());
}

}  // namespace
}  // namespace orvane::desktop::test
