// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/udisks/DiskReader.h"
#include "orvane/support/udisks/DiskRequest.h"
#include "orvane/support/udisks/UDisks.h"

#include <gtest/gtest.h>

namespace orvane {
namespace {

using Kind = Refusal::Kind;
using contract::DiskReference;

DiskFacts facts(const std::string& node, std::int32_t type, const std::string& mountPoint = "")
{
    DiskFacts facts;
    facts.identifier = facts.name = node;
    facts.path = node;
    facts.type = type;
    facts.filesystem = type == diskType::whole ? "" : "ext4";
    facts.mountPoint = mountPoint;
    facts.isBootVolume = mountPoint == "/";
    return facts;
}

DiskTree ejectable(const std::string& node, std::vector<DiskTree> children)
{
    DiskTree tree{facts(node, diskType::whole), std::move(children)};
    tree.facts.isEjectable = true;
    return tree;
}

std::shared_ptr<Disk> make(const DiskTree& tree)
{
    return Disk::make(tree, {[](std::string_view) {
                          return FilesystemCapabilities();
                      }});
}

TEST(DiskRequest, WhatIsPossibleFollowsFromTheDisk)
{
    DiskTree image{facts("/d.img", diskType::bareVolume), {}};
    image.facts.storage = DiskReference::Storage::FileRegion;
    DiskTree blank{facts("/dev/sdc1", diskType::volume), {}};
    blank.facts.filesystem.clear();
    const DiskTree free{facts("/dev/sdb1", diskType::volume), {}};
    const DiskTree mounted{facts("/dev/sdb2", diskType::volume, "/mnt"), {}};
    const DiskTree root{facts("/dev/sda1", diskType::volume, "/"), {}};
    struct Case {
        DiskTree tree;
        std::string possible;
        std::string_view because;
    };
    for (const Case& c :
         {Case{free, "M", "a volume"}, Case{mounted, "U", "a mounted one"},
          Case{root, "", "the system needs its root"}, Case{blank, "", "no file system is known"},
          Case{image, "", "an image file is no device"},
          Case{ejectable("/dev/sdb", {free, mounted}), "E", "a stick"},
          Case{ejectable("/dev/sda", {free, root}), "", "a stick that the system runs from"},
          Case{ejectable("/dev/loop7", {free, mounted}), "ED", "an attached image"},
          Case{ejectable("/dev/loop7", {root}), "", "one that the system runs from"},
          Case{DiskTree{facts("/dev/sdb", diskType::whole), {free}}, "", "a built-in disk"}}) {
        const auto disk = make(c.tree);
        std::string possible;
        for (const auto& [action, letter] :
             {std::pair(DiskAction::Mount, 'M'), std::pair(DiskAction::Unmount, 'U'),
              std::pair(DiskAction::Eject, 'E'), std::pair(DiskAction::Detach, 'D')})
            if (isPossible(action, *disk))
                possible += letter;
        EXPECT_EQ(possible, c.possible) << c.because;
        disk->setGone();
        EXPECT_FALSE(isPossible(DiskAction::Mount, *disk) || isPossible(DiskAction::Eject, *disk));
    }
}

TEST(DiskRequest, WhatMakesNoSenseIsSaid)
{
    DiskTree image{facts("/d.img", diskType::diskImage), {}};
    image.facts.storage = DiskReference::Storage::FileRegion;
    DiskTree blank{facts("/dev/sdc", diskType::whole), {}};
    const DiskTree free{facts("/dev/sdb1", diskType::volume), {}};
    const DiskTree whole{facts("/dev/sdb", diskType::whole), {free}};
    const DiskTree mounted{facts("/dev/sdb2", diskType::volume, "/mnt"), {}};
    struct Case {
        DiskAction action;
        DiskTree tree;
        Kind kind;
        std::string_view because;
    };
    for (const Case& c : {
             Case{DiskAction::Mount, mounted, Kind::AlreadySo, "no failure"},
             Case{DiskAction::Unmount, free, Kind::AlreadySo, "no failure"},
             Case{DiskAction::Mount, whole, Kind::IsWhole, "which of its volumes?"},
             Case{DiskAction::Unmount, whole, Kind::IsWhole, "which of its volumes?"},
             Case{DiskAction::Mount, blank, Kind::NoFilesystem, "it has no volumes"},
             Case{DiskAction::Mount, image, Kind::IsImage, "the way out is said"},
             Case{DiskAction::Detach, image, Kind::IsNoLoop, "nor is it attached"},
             Case{DiskAction::Detach, whole, Kind::IsNoLoop, "a real disk"},
             Case{DiskAction::Eject, whole, Kind::CannotEject, "a built-in disk"},
         }) {
        const auto objection = objectionTo(c.action, *make(c.tree));
        ASSERT_TRUE(objection) << c.because;
        EXPECT_EQ(objection->kind, c.kind) << c.because;
    }
}

TEST(DiskRequest, AnEjectedDriveIsUnmountedFirst)
{
    const auto stick = make(ejectable("/dev/sdb", {{facts("/dev/sdb1", diskType::volume, "/a"), {}},
                                                   {facts("/dev/sdb2", diskType::volume), {}}}));
    const auto request = requestFor(DiskAction::Eject, *stick->parts().back());
    EXPECT_EQ(request.identifier, "/dev/sdb") << "the part stands for its drive";
    EXPECT_EQ(request.steps, (std::vector<DiskStep>{{DiskStep::Kind::Unmount, "/dev/sdb1"},
                                                    {DiskStep::Kind::Eject, "/dev/sdb"}}));
    const auto loop = make(ejectable("/dev/loop7", {}));
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
    for (const Case& c :
         {Case{bus + "ServiceUnknown", "x", {Kind::NoService, "x"}, "not installed"},
          Case{bus + "Spawn.ChildExited", "x", {Kind::NoService, "x"}, "it did not come up"},
          Case{bus + "NoReply",
               "Message recipient disconnected from message bus without replying",
               {Kind::Ended, "Message recipient disconnected from message bus without replying"},
               "it died"},
          Case{bus + "NoReply",
               "Method call timed out",
               {Kind::NoAnswer, "Method call timed out"},
               "it hangs"},
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

TEST(Refusal, OnlyWhatTheUserKnowsAlreadyIsSilent)
{
    const auto request = requestFor(DiskAction::Unmount, *make({facts("/d", 3, "/m"), {}}));
    for (const Kind kind :
         {Kind::NoService, Kind::UnknownDevice, Kind::NoFilesystem, Kind::Busy, Kind::NotAllowed,
          Kind::NoAnswer, Kind::Ended, Kind::NoTable, Kind::CannotEject, Kind::HoldsSystem,
          Kind::IsImage, Kind::IsNoImage, Kind::IsWhole, Kind::IsNoLoop, Kind::HasGone,
          Kind::Lingers, Kind::Attached, Kind::BeingUsed, Kind::IsReadOnly}) {
        EXPECT_FALSE(isSilent({kind, {}}));
        EXPECT_GT(failureText(request, {kind, {}}, Translator()).size(),
                  std::string_view("cannot unmount “/d”: ").size())
            << "no reason for " << static_cast<int>(kind);
    }
    EXPECT_EQ(failureText(request, {Kind::Busy, "sh (7)"}, Translator()),
              "cannot unmount “/d”: it is in use by sh (7)");
}

TEST(DriveHealth, OnlyADriveThatSaysSoIsFailing)
{
    struct Case {
        DriveFacts drive;
        bool isFailing;
        std::string_view because;
    };
    for (const Case& c :
         {Case{{"/d", {1700000000, true}, {}}, true, "SMART says so"},
          Case{{"/d", {1700000000, false}, {}}, false, "SMART denies it"},
          Case{{"/d", {0, true}, {}}, false, "nobody has asked the drive"},
          Case{{"/d", {}, {"temperature"}}, false, "hot is not broken"},
          Case{{"/d", {}, {"temperature", "readonly"}}, true, "it cannot be written any more"}})
        EXPECT_EQ(isFailing(c.drive), c.isFailing) << c.because;
}

TEST(DriveHealth, AllPartsOfAFailingDriveAreMarked)
{
    const auto nodes =
        failingDevices({{"/drive/a", {1, true}, {}}, {"/drive/b", {1, false}, {}}},
                       {{"/dev/sda", "/drive/a"}, {"/dev/sdb", "/drive/b"}, {"/dev/loop0", "/"}});
    EXPECT_EQ(nodes, (std::set<std::string>{"/dev/sda"}));
    std::vector<DiskTree> disks{
        {facts("/dev/sda", diskType::whole), {{facts("/dev/sda1", diskType::volume), {}}}},
        {facts("/dev/sdb", diskType::whole), {{facts("/dev/sdb1", diskType::volume), {}}}}};
    markFailing(disks, nodes);
    EXPECT_TRUE(make(disks[0])->parts().front()->hasSMARTError());
    EXPECT_FALSE(make(disks[1])->hasSMARTError());
}

}  // namespace
}  // namespace orvane
