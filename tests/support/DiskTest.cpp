// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/DiskLookup.h"
#include "orvane/support/disks/DiskController.h"
#include "orvane/support/disks/DiskWatch.h"
#include "orvane/support/disks/FormatName.h"
#include "orvane/support/disks/SystemDisks.h"
#include "orvane/support/loop/MainLoop.h"
#include "orvane/support/loop/Notifications.h"
#include "pellar/mounts/MountTable.h"
#include "tests/support/LoopDevice.h"
#include "tests/support/TestDirectory.h"

#include <gtest/gtest.h>
#include <sys/mount.h>
#include <unistd.h>

#include <chrono>

namespace orvane {
namespace {

using test::TestDirectory;
namespace fs = std::filesystem;

DiskTree tree(const std::string& identifier, std::vector<DiskTree> children = {})
{
    DiskTree made{{}, std::move(children)};
    made.facts.identifier = identifier;
    made.facts.name = identifier;
    made.facts.type = made.children.empty() ? diskType::volume : diskType::whole;
    return made;
}

/// A controller with an ear for what it posts.
struct Host {
    Host()
    {
        for (const contract::Name name :
             {contract::OVDiskAppearedNotification, contract::OVDiskUnmountedNotification,
              contract::OVDiskChangedNotification, contract::OVDiskEjectedNotification})
            center.addObserver(this, name, [this](const contract::Notification& notification) {
                heard += notification.name.text().substr(6, 2);
                heard += ' ' + notification.object->description() + '\n';
            });
    }
    std::string takeHeard() { return std::exchange(heard, {}); }

    Notifications center;
    std::string heard;
    DiskController controller{center, {}};
};

TEST(DiskController, TellsWhatHasHappenedToTheSystemsDisks)
{
    Host host;
    host.controller.synchronize({tree("sda", {tree("sda1"), tree("sda2")})});
    EXPECT_EQ(host.takeHeard(), "Ap sda\nAp sda1\nAp sda2\n");
    const auto kept = host.controller.diskNamed("sda1");

    DiskTree mounted = tree("sda1");
    mounted.facts.mountPoint = "/mnt";
    host.controller.synchronize({tree("sda", {mounted, tree("sda3")})});
    EXPECT_EQ(host.takeHeard(), "Ej sda2\nCh sda1\nAp sda3\n");
    EXPECT_EQ(host.controller.diskNamed("sda1"), kept) << "a known disk stays the same object";

    host.controller.synchronize({tree("sda", {tree("sda1"), tree("sda3")})});
    EXPECT_EQ(host.takeHeard(), "Un sda1\n");
    host.controller.synchronize({});
    EXPECT_EQ(host.takeHeard(), "Ej sda3\nEj sda1\nEj sda\n");
    EXPECT_EQ(host.controller.diskWithIdentifier("sda1"), nullptr);
}

TEST(DiskController, ADeviceThatIsGivenAnotherImageIsAnotherDisk)
{
    Host host;
    DiskTree loop = tree("loop0");
    loop.facts.sequence = 7;
    host.controller.synchronize({loop});
    const auto before = host.controller.diskNamed("loop0");
    loop.facts.sequence = 8;
    host.controller.synchronize({loop});
    EXPECT_NE(host.controller.diskNamed("loop0"), before) << "though all else of it is the same";
}

TEST(DiskController, WhatGoesDuringItsJobKeepsItsPlaceUntilTheEnd)
{
    Host host;
    const auto sda = tree("sda", {tree("sda1"), tree("sda2")});
    const auto sdb = tree("sdb", {tree("sdb1")});
    host.controller.synchronize({sda, sdb});
    const auto volume = host.controller.diskNamed("sda1");
    const auto reference = volume->theKRDisk();
    host.controller.hold({volume});
    host.takeHeard();

    for (const char* const told : {"Ej sda1\n", ""}) {
        host.controller.synchronize({tree("sda", {tree("sda2")}), sdb});
        EXPECT_EQ(host.takeHeard(), told) << "the partition alone, and told once";
        EXPECT_EQ(host.controller.diskNamed("sda1"), volume);
    }
    host.controller.synchronize({});
    EXPECT_EQ(host.takeHeard(), "Ej sda2\nEj sda\nEj sdb1\nEj sdb\n");
    EXPECT_EQ(host.controller.diskWithKRDisk(reference), volume) << "the tool still speaks of it";
    EXPECT_TRUE(volume->theKRDisk()->path.empty()) << "nothing more can begin on it";

    host.controller.synchronize({sda});
    EXPECT_EQ(host.takeHeard(), "") << "another disk with its name has to wait";
    EXPECT_EQ(host.controller.diskNamed("sda1"), volume);

    EXPECT_TRUE(host.controller.release());
    EXPECT_EQ(host.takeHeard(), "") << "it was told already";
    EXPECT_EQ(host.controller.diskNamed("sda1"), nullptr);
    EXPECT_FALSE(host.controller.release());
    host.controller.synchronize({sda});
    EXPECT_EQ(host.takeHeard(), "Ap sda\nAp sda1\nAp sda2\n");
}

TEST(DiskController, WhatWasNotMountedBeforeAJobIsNotMountedAfterIt)
{
    Host host;
    std::string mounted;
    host.controller.hooks().mount = [&mounted](const Disk& disk) -> Result<void, Failure> {
        mounted += disk.diskIdentifier() + " ";
        return {};
    };
    DiskTree busy = tree("sda2");
    busy.facts.mountPoint = "/mnt";
    host.controller.synchronize({tree("sda", {tree("sda1"), busy})});
    const auto whole = host.controller.diskNamed("sda");
    host.controller.hold({whole});
    host.controller.synchronize({tree("sda", {tree("sda1"), tree("sda2")})});
    host.controller.release();
    host.controller.mountDisk(whole, true, false);
    EXPECT_EQ(mounted, "sda2 ");
}

TEST(SystemDisks, ReadsAMachineMadeOfFiles)
{
    const TestDirectory machine;
    const auto device = [&](const std::string& name, const char* number, const char* size) {
        test::write(machine.path() / "sys" / name / "dev", std::string(number) + "\n");
        test::write(machine.path() / "sys" / name / "size", std::string(size) + "\n");
    };
    device("sda", "8:0", "2048");
    device("sda/sda1", "8:1", "1024");
    device("sda/sda10", "8:10", "2");
    device("sda/sda2", "8:2", "1024");
    for (const char* const number : {"1", "2", "10"})
        test::write(machine.path() / "sys/sda" / ("sda" + std::string(number)) / "partition",
                    number);
    test::write(machine / "sys/sda/device/model", "Model \x1b[1m X  \n");
    device("loop0", "7:0", "0");
    device("zram0", "252:0", "4096");
    device("sdb", "8:16", "4096");
    test::write(machine / "sys/sdb/diskseq", "7\n");
    device("sdc", "8:32", "4096");
    test::write(machine / "udev/b8:1",
                "S:disk/by-id\nE:NOVALUE\nE:ID_FS_USAGE=filesystem\nE:ID_FS_TYPE=ext4\n"
                "E:ID_FS_UUID=u-1\nE:ID_FS_LABEL_ENC=My\\x20D=\\x1b\\x\n");
    test::write(machine / "udev/b8:0", "E:ID_PART_TABLE_TYPE=gpt\n");
    test::write(machine / "udev/b8:16",
                "E:ID_FS_USAGE=filesystem\nE:ID_FS_TYPE=vfat\nE:ID_FS_VERSION=FAT16\n");

    DiskSources sources{machine / "sys", machine / "dev", machine / "udev",
                        pellar::parseMounts("22 1 8:1 / / rw - ext4 /dev/sda1 rw\n"
                                            "23 22 8:32 / /mnt rw - xfs /dev/sdc rw\n"),
                        "/mnt"};
    const auto disks = readSystemDisks(sources);
    ASSERT_EQ(disks.size(), 3U) << "no memory, no unused loop device";
    EXPECT_EQ(disks[0].facts.name, "Model \x1b[1m X") << "bytes as they are";
    ASSERT_EQ(disks[0].children.size(), 3U);
    const DiskFacts& root = disks[0].children[0].facts;
    EXPECT_EQ(root.name, "My D=\x1b\\x") << "from udev, as the device cannot be read";
    EXPECT_TRUE(root.isBootVolume && !root.containsUserHome && root.isShown);
    EXPECT_EQ(disks[0].children[1].facts.number, 2) << "2 before 10";
    EXPECT_EQ(disks[0].children[2].facts.type, diskType::container);
    EXPECT_EQ(disks[1].facts.type, diskType::bareVolume);
    EXPECT_EQ(disks[1].facts.sequence, 7U);
    EXPECT_EQ(disks[0].facts.partitionMap, "gpt");
    EXPECT_EQ(formatName(disks[1].facts.filesystem, disks[1].facts.filesystemVersion), "FAT16");
    EXPECT_EQ(disks[2].facts.type, diskType::bareVolume) << "it is mounted, so it is a volume";
    EXPECT_TRUE(disks[2].facts.containsUserHome);
}

TEST(DiskLookup, ABadNameGetsOneClearSentence)
{
    const TestDirectory directory;
    test::write(directory / "empty.img", "");
    test::write(directory / "secret.img", "x");
    fs::permissions(directory / "secret.img", fs::perms::none);
    const std::string path = directory.path().native() + "/";

    struct Case {
        std::string name;
        std::string reason;
    };
    for (const Case& c :
         {Case{"", "it has no name"}, Case{path + "missing.img", "No such file or directory"},
          Case{path + "empty.img", "the file is empty"},
          Case{path + "secret.img", "Permission denied"},
          Case{"/dev/null", "it is neither a disk nor a disk image"},
          Case{directory.path(), "this directory is no mount point"},
          Case{"/proc", "no disk is mounted on this directory"},
          Case{"LABEL=", "no disk has this label"}, Case{"UUID=1234", "no disk has this UUID"}}) {
        if (c.reason == "Permission denied" && ::geteuid() == 0)
            continue;  // root may read everything
        Host host;
        const Translator translator;
        const auto found = DiskLookup(host.controller, translator).find(c.name);
        ASSERT_FALSE(found) << c.name;
        EXPECT_EQ(found.error().message, "cannot use ‘" + c.name + "’: " + c.reason);
    }
}

TEST(DiskLookup, FindsByEveryKindOfName)
{
    const TestDirectory directory;
    test::write(directory / "a.img", std::string(512, '\0'));
    fs::create_symlink("a.img", directory / "link");
    Host host;
    DiskTree volume = tree("/dev/x1");
    volume.facts.label = "Hostile \x1b[2J %s";
    volume.facts.uuid = "u-1";
    volume.facts.mountPoint = directory.path();
    DiskTree twin = tree("/dev/x2");
    twin.facts.uuid = "u-2";
    DiskTree other = tree("/dev/x3");
    other.facts.uuid = "u-2";
    host.controller.synchronize({volume, twin, other});
    const Translator translator;
    DiskLookup lookup(host.controller, translator);
    for (const std::string& name : {std::string("/dev/x1"), std::string("LABEL=Hostile \x1b[2J %s"),
                                    std::string("UUID=u-1"), directory.path().native()}) {
        const auto found = lookup.find(name);
        ASSERT_TRUE(found) << found.error().message;
        EXPECT_EQ((*found)->diskIdentifier(), "/dev/x1");
    }
    EXPECT_FALSE(lookup.find("UUID=u-2")) << "two have it: not a guess";

    const auto image = lookup.find((directory / "link").native());
    ASSERT_TRUE(image);
    const auto disk = *image;
    EXPECT_EQ(disk->diskIdentifier(), (directory / "a.img").native());
    EXPECT_EQ(*lookup.find((directory / "a.img").native()), disk);
}

using namespace std::string_view_literals;
using namespace std::chrono_literals;
using test::LoopDevice;

TEST(DiskEvents, OnlyBlockDevicesMatter)
{
    struct Case {
        std::string_view message;
        bool isMeant;
        std::string_view because;
    };
    for (const Case& c :
         {Case{"change@/devices/virtual/block/loop0\0ACTION=change\0SUBSYSTEM=block\0MAJOR=7\0"sv,
               true, "as the kernel says it"},
          Case{"libudev\0\xfe\xed\xca\xfe\x28\0\0\0ACTION=add\0SUBSYSTEM=block\0"sv, true,
               "as udevd says it"},
          Case{"add@/devices/x\0ACTION=add\0SUBSYSTEM=usb\0"sv, false, "another device"},
          Case{"add@/devices/x\0SUBSYSTEM=blocks\0"sv, false, "a longer name"},
          Case{"add@/devices/x\0MY=SUBSYSTEM=block\0"sv, false, "the value of another field"},
          Case{"\0SUBSYSTEM=block"sv, false, "cut off"}, Case{""sv, false, "empty"}})
        EXPECT_EQ(isAboutBlockDevice(c.message), c.isMeant) << c.because;
}

TEST(DiskEvents, MountsWithoutADeviceDoNotMatter)
{
    const auto kept = deviceMounts(pellar::parseMounts(
        "22 1 8:2 / / rw - ext4 /dev/sda2 rw\n30 22 0:5 / /proc rw - proc proc rw\n"
        "32 22 0:40 / /home rw - btrfs /dev/sdb1 rw\n"
        "33 22 0:50 / /c/1 rw - overlay overlay rw\n"));
    ASSERT_EQ(kept.size(), 2U);
    EXPECT_EQ(kept[1].filesystem, "btrfs") << "it has a number of its own, but a device";
}

TEST(DiskEvents, ABurstIsOneChange)
{
    const EventBurst::Clock::time_point start{};
    EventBurst burst;
    EXPECT_FALSE(burst.takeDue(start)) << "nothing has happened";
    burst.note(start);
    burst.note(start + 150ms);
    EXPECT_FALSE(burst.takeDue(start + 210ms)) << "not quiet yet";
    EXPECT_EQ(burst.timeLeft(start + 210ms), 140ms);
    EXPECT_TRUE(burst.takeDue(start + 350ms));

    int told = 0;
    for (auto now = start; now < start + 10s; now += 100ms) {
        burst.note(now);
        told += burst.takeDue(now) ? 1 : 0;
    }
    EXPECT_EQ(told, 9) << "events without end cannot keep the news back";
}

// The machine's own disks, as a front end follows them.
TEST(DiskWatch, ARealDeviceComesIsMountedUnmountedAndGoes)
{
    if (const char* const obstacle = LoopDevice::obstacle())
        GTEST_SKIP() << obstacle;
    const TestDirectory directory;
    // Another process may run this test at the same time.
    const std::string label = "watched" + std::to_string(::getpid());
    const std::string image = directory.makeExt("watched.img", 8 << 20, {"-L", label});
    MainLoop loop;
    Notifications center;
    DiskController disks(center, {});
    DiskWatch watch(loop, [&] { disks.synchronize(readSystemDisks(DiskSources())); });
    ASSERT_TRUE(watch.start());
    const auto found = [&] {
        return disks.find([&](const Disk& disk) { return disk.facts().label == label; });
    };
    const auto waitUntil = [&loop](const std::function<bool()>& isDone) {
        bool isLate = false;
        loop.scheduleTimer(20s, [&] { isLate = true; });
        loop.runUntil([&] { return isLate || isDone(); });
        return isDone();
    };
    LoopDevice device(image);
    ASSERT_TRUE(waitUntil([&] { return found() != nullptr; }));
    const auto disk = found();
    EXPECT_EQ(disk->diskIdentifier(), device.name());
    const std::string mountPoint = directory / "mnt";
    std::filesystem::create_directory(mountPoint);
    if (::mount(device.name().c_str(), mountPoint.c_str(), "ext4", 0, nullptr) == 0) {
        EXPECT_TRUE(waitUntil([&] { return disk->mountPoint() == mountPoint; }));
        ASSERT_EQ(::umount(mountPoint.c_str()), 0);
        EXPECT_TRUE(waitUntil([&] { return !disk->isMounted(); }));
    }
    device.detach();
    EXPECT_TRUE(waitUntil([&] { return found() == nullptr; }));
    EXPECT_TRUE(disk->hasGone());
}

}  // namespace
}  // namespace orvane
