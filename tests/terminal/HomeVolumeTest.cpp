// SPDX-License-Identifier: Apache-2.0
// A volume on which the user's home lies, and which therefore stays mounted. Needs root.

#include "tests/support/LoopDevice.h"
#include "tests/support/ScrubRecords.h"
#include "tests/support/ToolRun.h"
#include "tests/terminal/ProgramTest.h"

#include <sys/mount.h>

namespace orvane::test {
namespace {

class HomeVolumeTest : public ProgramTest {
protected:
    void TearDown() override
    {
        ::umount2(path("home").c_str(), MNT_DETACH);
        device_.reset();
        forgetScrubsOf(path("image"));
        ProgramTest::TearDown();
    }

    /// Why there can be none; null when there is one, mounted as the home.
    const char* obstacle(const char* filesystem, const char* maker)
    {
        if (const char* const why = LoopDevice::obstacle())
            return why;
        write(path("image"), {});
        std::filesystem::resize_file(path("image"), 128 * mebibyte);
        if (runTool({maker, "-q", path("image")}) != 0)
            return "the tool that makes the volume is not installed";
        device_ = std::make_unique<LoopDevice>(path("image"));
        std::filesystem::create_directory(path("home"));
        return ::mount(device_->name().c_str(), path("home").c_str(), filesystem, 0, nullptr) == 0
                   ? nullptr
                   : "the system mounts no such volume here";
    }

    /// Why the list says that this cannot be done; "none" where it can.
    std::string reasonAgainst(const char* name) const
    {
        const Events events(run({"list", "--json", device_->name()}).output);
        const nlohmann::json action = events.named("disk").at(0)["actions"][name];
        return action["available"] ? "none" : action["reason"].get<std::string>();
    }

    std::unique_ptr<LoopDevice> device_;
};

TEST_F(HomeVolumeTest, IsVerifiedInUseWhereItIsBtrfs)
{
    if (const char* const why = obstacle("btrfs", "mkfs.btrfs"))
        GTEST_SKIP() << why;
    EXPECT_EQ(reasonAgainst("verify"), "none");
    EXPECT_NE(reasonAgainst("repair").find("contains your home directory"), std::string::npos);
    const RunResult result = run({"verify", "--details", device_->name()});
    EXPECT_EQ(result.status, 0) << result.output << result.errors;
    EXPECT_NE(result.output.find("while it stays mounted"), std::string::npos) << result.output;
}

TEST_F(HomeVolumeTest, IsNotVerifiedWhereItIsExt4AndTheReasonIsTold)
{
    if (const char* const why = obstacle("ext4", "mkfs.ext4"))
        GTEST_SKIP() << why;
    EXPECT_NE(reasonAgainst("verify").find("only from a snapshot"), std::string::npos);
    EXPECT_EQ(run({"verify", device_->name()}).status, 8);
}

}  // namespace
}  // namespace orvane::test
