// SPDX-License-Identifier: Apache-2.0
// A volume inside an image, for somebody who may not attach one.

#include "pellar/jobs/Job.h"
#include "pellar/jobs/PartOfImageScript.h"
#include "pellar/tools/ToolTable.h"
#include "tests/pellar/Workshop.h"

#include <gtest/gtest.h>

namespace pellar {
namespace {

/// Those who have the right; they end the job at once.
class Others final : public Script {
public:
    explicit Others(EventRoad& road) : road_(road) {}
    void run() override
    {
        road_.add(Started{});
        road_.add(Finished{});
        road_.flush();
    }

private:
    EventRoad& road_;
};

TEST(PartOfImage, OthersAreAskedOnlyWhereTheToolNeedsADevice)
{
    const test::Workshop workshop;
    workshop.write("image", std::string(1 << 20, 'x'));
    const std::string tools = workshop.fakeTools("exit 0");
    for (const char* tool : {"fsck.fat", "btrfs"})
        static_cast<void>(workshop.fakeTools("exit 0", tool));
    struct Case {
        std::string filesystem;
        Operation operation;
        bool isAsked;
        std::string_view because;
    };
    for (const Case& c : {
             Case{"vfat", Operation::Verify, true, "fsck.fat knows no offsets"},
             Case{"vfat", Operation::Repair, true, "nor does it when it repairs"},
             Case{"ext4", Operation::Repair, false, "e2fsck finds it in the file"},
             Case{"btrfs", Operation::Verify, true, "a check of it is possible"},
             Case{"btrfs", Operation::Repair, false, "but no repair, whoever does it"},
             Case{"f2fs", Operation::Verify, false, "its tool is not installed"},
             Case{"swap", Operation::Verify, false, "nothing checks it"},
             Case{"", Operation::Verify, false, "nothing recognises it"},
         }) {
        ManagerOptions options;
        options.toolPath = tools;
        std::optional<PrivilegedJob> asked;
        options.privileged = [&asked](const PrivilegedJob& job, StopSwitch&, EventRoad& road) {
            asked = job;
            return std::make_unique<Others>(road);
        };
        auto part = *test::reference(workshop.path("image"), c.filesystem);
        part.offset = 4096;
        part.length = 1 << 16;
        const auto disk = std::make_shared<const contract::DiskReference>(part);
        auto claim = DiskClaim::take(*disk, Access::ReadWrite, {});
        auto request = std::make_shared<JobRequest>(JobRequest{
            disk, c.operation, std::get<DiskClaim>(std::move(claim)), {}, toolFor(c.filesystem)});
        test::TestLoop loop;
        const test::EnglishTexts texts;
        test::Listener listener;
        const Job job(
            [&](StopSwitch& stop, EventRoad& road) {
                return std::make_unique<PartOfImageScript>(std::move(*request), options, texts,
                                                           stop, road);
            },
            EventReceiver{&listener,
                          disk,
                          {},
                          [] {
                          }},
            loop);
        ASSERT_TRUE(loop.runUntil([&] { return listener.finished == 1; })) << c.because;
        EXPECT_EQ(listener.started, 1) << c.because;
        ASSERT_EQ(asked.has_value(), c.isAsked) << c.because;
        if (!asked)
            continue;
        ASSERT_TRUE(asked->image);
        EXPECT_EQ(asked->image->offset(), 4096U);
        EXPECT_EQ(asked->operation, c.operation);
    }
}

}  // namespace
}  // namespace pellar
