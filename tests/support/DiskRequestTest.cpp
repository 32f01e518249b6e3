// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/udisks/DiskReader.h"
#include "orvane/support/udisks/DiskRequest.h"
#include "orvane/support/udisks/UDisks.h"

#include <gtest/gtest.h>

#include <array>

namespace orvane {
namespace {

using Kind = Refusal::Kind;

DiskTree disk(const std::string& node, std::int32_t type, const std::string& mountPoint = "",
              std::vector<DiskTree> children = {})
{
    DiskTree tree{{}, std::move(children)};
    tree.facts.identifier = tree.facts.name = node;
    tree.facts.path = node;
    tree.facts.type = type;
    tree.facts.filesystem = type == diskType::whole ? "" : "ext4";
    tree.facts.mountPoint = mountPoint;
    tree.facts.isBootVolume = mountPoint == "/";
    return tree;
}

DiskTree ejectable(const std::string& node, std::vector<DiskTree> children)
{
    DiskTree tree = disk(node, diskType::whole, "", std::move(children));
    tree.facts.isEjectable = true;
    return tree;
}

TEST(DiskRequest, WhatIsPossibleFollowsFromTheDisk)
{
    DiskTree image = disk("/d.img", diskType::bareVolume);
    image.facts.storage = contract::DiskReference::Storage::FileRegion;
    DiskTree blank = disk("/dev/sdc1", diskType::volume);
    blank.facts.filesystem.clear();
    const DiskTree free = disk("/dev/sdb1", diskType::volume);
    const DiskTree mounted = disk("/dev/sdb2", diskType::volume, "/mnt");
    const DiskTree root = disk("/dev/sda1", diskType::volume, "/");
    constexpr std::optional<Kind> possible;
    struct Case {
        DiskTree tree;
        std::array<std::optional<Kind>, 4> objections;  ///< mount, unmount, eject, detach
        std::string_view because;
    };
    for (const Case& c :
         {Case{free, {possible, Kind::AlreadySo, Kind::CannotEject, Kind::IsNoLoop}, "a volume"},
          Case{mounted, {Kind::AlreadySo, possible, Kind::CannotEject, Kind::IsNoLoop}, "mounted"},
          Case{root,
               {Kind::AlreadySo, Kind::HoldsSystem, Kind::HoldsSystem, Kind::IsNoLoop},
               "the system needs its root"},
          Case{blank,
               {Kind::NoFilesystem, Kind::AlreadySo, Kind::CannotEject, Kind::IsNoLoop},
               "no file system is known"},
          Case{image,
               {Kind::IsImage, Kind::IsImage, Kind::IsImage, Kind::IsNoLoop},
               "an image file is no device"},
          Case{ejectable("/dev/sdb", {free, mounted}),
               {Kind::IsWhole, Kind::IsWhole, possible, Kind::IsNoLoop},
               "a stick"},
          Case{ejectable("/dev/loop7", {free, mounted}),
               {Kind::IsWhole, Kind::IsWhole, possible, possible},
               "an attached image"},
          Case{ejectable("/dev/loop7", {root}),
               {Kind::IsWhole, Kind::IsWhole, Kind::HoldsSystem, Kind::HoldsSystem},
               "one that the system runs from"},
          Case{disk("/dev/sdb", diskType::whole, "", {free}),
               {Kind::IsWhole, Kind::IsWhole, Kind::CannotEject, Kind::IsNoLoop},
               "a built-in disk"}}) {
        const auto made = Disk::make(c.tree, {});
        std::size_t i = 0;
        for (const DiskAction action :
             {DiskAction::Mount, DiskAction::Unmount, DiskAction::Eject, DiskAction::Detach}) {
            const auto objection = objectionTo(action, *made);
            EXPECT_EQ(objection ? std::optional(objection->kind) : possible, c.objections.at(i++))
                << c.because << ", action " << i;
        }
        made->setGone();
        EXPECT_EQ(objectionTo(DiskAction::Eject, *made), (Refusal{Kind::HasGone, {}}));
    }
}

TEST(DiskRequest, AnEjectedDriveIsUnmountedFirst)
{
    const auto stick = Disk::make(ejectable("/dev/sdb", {disk("/dev/sdb1", diskType::volume, "/a"),
                                                         disk("/dev/sdb2", diskType::volume)}),
                                  {});
    const auto request = requestFor(DiskAction::Eject, *stick->parts().back());
    EXPECT_EQ(request.identifier, "/dev/sdb") << "the part stands for its drive";
    EXPECT_EQ(request.steps, (std::vector<DiskStep>{{DiskStep::Kind::Unmount, "/dev/sdb1"},
                                                    {DiskStep::Kind::Eject, "/dev/sdb"}}));
    const auto loop = Disk::make(ejectable("/dev/loop7", {}), {});
    EXPECT_EQ(requestFor(DiskAction::Eject, *loop).steps,
              (std::vector<DiskStep>{{DiskStep::Kind::DetachLoop, "/dev/loop7"}}));
}

TEST(Refusal, AnErrorOfTheBusIsUnderstood)
{
    struct Case {
        std::string name;
        std::string_view text;
        Refusal refusal;
        std::string_view because;
    };
    const std::string bus = "org.freedesktop.DBus.Error.";
    const std::string udisks = "org.freedesktop.UDisks2.Error.";
    const std::string left = "Message recipient disconnected from message bus without replying";
    for (const Case& c :
         {Case{bus + "ServiceUnknown", "x", {Kind::NoService, "x"}, "not installed"},
          Case{bus + "Spawn.ChildExited", "x", {Kind::NoService, "x"}, "it did not come up"},
          Case{bus + "NoReply", left, {Kind::Ended, left}, "it died"},
          Case{bus + "NoReply", "timed out", {Kind::NoAnswer, "timed out"}, "it hangs"},
          Case{udisks + "NotAuthorizedDismissed", "", {Kind::Dismissed, ""}, "the longer name"},
          Case{udisks + "NotAuthorizedCanObtain", "", {Kind::NotAllowed, ""}, "all of them"},
          Case{udisks + "DeviceBusy", "target is busy", {Kind::Busy, ""}, "names nobody"},
          Case{udisks + "Failed",
               "wrong \x1b[31m\n%s\xff",
               {Kind::Other, "wrong \uFFFD[31m\uFFFD%s\uFFFD"},
               "a hostile label in it"},
          Case{udisks + "Failed", "", {Kind::Other, udisks + "Failed"}, "something must be said"}})
        EXPECT_EQ(refusalOf(c.name, c.text), c.refusal) << c.because;
}

TEST(Refusal, EveryOneThatIsNotSilentIsSaid)
{
    const auto mounted = Disk::make(disk("/d", diskType::volume, "/m"), {});
    const auto request = requestFor(DiskAction::Unmount, *mounted);
    for (int kind = 0; kind < static_cast<int>(Kind::Other); ++kind) {
        const Refusal refusal{static_cast<Kind>(kind), {}};
        EXPECT_TRUE(isSilent(refusal) ||
                    !failureText(request, refusal, Translator()).ends_with(": "))
            << "no reason for " << kind;
    }
    EXPECT_EQ(failureText(request, {Kind::Busy, "sh (7)"}, Translator()),
              "cannot unmount “/d”: it is in use by sh (7)");
}

TEST(DriveHealth, OnlyADriveThatSaysSoIsFailing)
{
    struct Case {
        DriveHealth drive;
        bool isFailing;
        std::string_view because;
    };
    for (const Case& c : {Case{{1700000000, true, {}}, true, "SMART says so"},
                          Case{{1700000000, false, {}}, false, "SMART denies it"},
                          Case{{0, true, {}}, false, "nobody has asked the drive"},
                          Case{{0, false, {"temperature"}}, false, "hot is not broken"},
                          Case{{0, false, {"temperature", "readonly"}}, true, "broken"}})
        EXPECT_EQ(isFailing(c.drive), c.isFailing) << c.because;

    std::vector<DiskTree> disks{
        disk("/dev/sda", diskType::whole, "", {disk("/dev/sda1", diskType::volume)}),
        disk("/dev/sdb", diskType::whole, "", {disk("/dev/sdb1", diskType::volume)})};
    markFailing(disks, {"/dev/sda"});
    EXPECT_TRUE(disks[0].children[0].facts.hasSMARTError) << "its parts fail with it";
    EXPECT_FALSE(disks[1].facts.hasSMARTError);
}

}  // namespace
}  // namespace orvane
