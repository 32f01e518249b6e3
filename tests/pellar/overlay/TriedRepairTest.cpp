// SPDX-License-Identifier: Apache-2.0
//
// Repairs that are tried first, and what keeps them from being applied.

#include "contract/pellar/ErrorCodes.h"
#include "contract/pellar/MessageKeys.h"
#include "tests/pellar/JobFixture.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>

namespace {

using namespace pellar;
using orvane::test::contentsOf;
using orvane::test::patch;

/// A volume of which the free blocks are counted wrong, and e2fsck, which in its repair first waits
/// for a file called "go".
class TriedRepair : public ::testing::Test {
protected:
    void SetUp() override
    {
        directory_.damage(image_, "set_super_value free_blocks_count 1");
        before_ = contentsOf(image_);
        options_.toolPath =
            directory_.fakeTools("await-in-repair go\nbecome " + e2fsck_.string() + "\n");
    }

    void letTheToolGo() const
    {
        orvane::test::write(std::filesystem::path(options_.toolPath) / "go", "");
    }

    void repair()
    {
        letTheToolGo();
        ASSERT_EQ(library().repair(disk_), 0);
    }

    test::JobFixture& library()
    {
        if (!library_)
            library_.emplace(options_);
        return *library_;
    }

    test::TestDirectory directory_;
    const std::filesystem::path image_ = directory_.makeExt("disk", 8U << 20U);
    const contract::DiskReferencePointer disk_ = test::reference(image_);
    const std::filesystem::path e2fsck_ = findProgram("e2fsck", "/usr/sbin:/sbin");
    std::string before_;
    RepairPolicy policy_;
    JobOptions options_ = test::tryingIn(directory_.path("repairs"), &policy_);
    std::optional<test::JobFixture> library_;
};

TEST_F(TriedRepair, IsNotAppliedToADiskThatAnotherHasWrittenTo)
{
    bool isChanged = false;
    library().listener.onMessage = [&] {
        const auto& heard = library().listener.dictionaries;
        const bool isTrying =
            !heard.empty() &&
            test::contains(heard.back().string(contract::kFsckMessageString), "Trying the repair");
        if (!isTrying || std::exchange(isChanged, true))
            return;
        // The tool waits until this is done; the trial has begun by then.
        ::usleep(200'000);
        patch(image_, 5U << 20U, "another");
        letTheToolGo();
    };
    ASSERT_EQ(library().repair(disk_), 0);
    EXPECT_TRUE(isChanged);
    EXPECT_EQ(library().listener.error, contract::kPLErrorDiskChanged)
        << library().listener.message;
    before_.replace(5U << 20U, 7, "another");
    EXPECT_TRUE(contentsOf(image_) == before_);
}

TEST_F(TriedRepair, WritesNothingWhereWhatItWouldWriteCannotBeKept)
{
    options_.trials.room.mostBytes = 1024;
    repair();
    EXPECT_TRUE(test::contains(library().listener.message, "no room"))
        << library().listener.message;
    EXPECT_TRUE(contentsOf(image_) == before_);
    library_.reset();
    options_.trials.room = {directory_.path("disk") / "below", 1U << 20U};
    options_.trials.howToRepairDirectly = [](const contract::DiskReference& disk) {
        return "Directly: " + disk.path.native();
    };
    repair();
    EXPECT_TRUE(std::ranges::any_of(library().listener.dictionaries, [this](const auto& message) {
        return message.string(contract::kFsckMessageString) == "Directly: " + image_.native();
    }));
    EXPECT_EQ(library().listener.error, contract::kPLErrorNotTried);
    EXPECT_TRUE(contentsOf(image_) == before_);
    library_.reset();
    policy_.isDirect = true;
    repair();
    EXPECT_EQ(library().listener.verdict, "repaired") << library().listener.message;
}

TEST_F(TriedRepair, IsForgottenWhereTheUserWantsNoUndo)
{
    policy_.keepsUndo = false;
    repair();
    EXPECT_EQ(library().listener.verdict, "repaired") << library().listener.message;
    EXPECT_TRUE(std::filesystem::is_empty(recordsIn(options_.trials)));
    ASSERT_EQ(library().run({Subject::Filesystem, Operation::Undo}, disk_), 0);
    EXPECT_EQ(library().listener.error, contract::kPLErrorNothingToUndo);
}

TEST_F(TriedRepair, OfAnotherUserIsNotUndone)
{
    repair();
    library_.reset();
    options_.trials.user = 12345;
    ASSERT_EQ(library().run({Subject::Filesystem, Operation::Undo}, disk_), 0);
    EXPECT_EQ(library().listener.error, contract::kPLErrorNotAuthorized);
}

// What e2fsck -n does not see and -y changes makes a thorough verification answer "damaged".
TEST_F(TriedRepair, DecidesWhereReadingDoesNot)
{
    ASSERT_EQ(test::runTool({"e2fsck", "-fy", image_.string()}).status, 1);
    letTheToolGo();
    policy_.isThorough = true;
    before_ = contentsOf(image_);
    ASSERT_EQ(library().verify(disk_), 0);
    EXPECT_EQ(library().listener.verdict, "sound") << library().listener.message;
    EXPECT_EQ(library().traces.size(), 5U) << "reading, repairing, reading";
    policy_.isThorough = false;
    directory_.damage(image_, "feature needs_recovery");
    before_ = contentsOf(image_);
    ASSERT_EQ(library().verify(disk_), 0);
    EXPECT_EQ(library().listener.verdict, "sound") << library().listener.message;
    directory_.damage(image_, "set_inode_field <2> links_count 9");
    before_ = contentsOf(image_);
    ASSERT_EQ(library().verify(disk_), 0);
    EXPECT_EQ(library().listener.verdict, "damaged") << library().listener.message;
    EXPECT_TRUE(contentsOf(image_) == before_) << "a verification wrote";
}

}  // namespace
