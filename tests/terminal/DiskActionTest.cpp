// SPDX-License-Identifier: Apache-2.0
// Mounting, ejecting and attaching as root where there is no UDisks2.

#include "tests/support/LoopDevice.h"
#include "tests/support/ToolRun.h"
#include "tests/terminal/ProgramTest.h"

#include <fstream>

namespace orvane::test {
namespace {

class DiskActionTest : public ProgramTest {
protected:
    void SetUp() override
    {
        ProgramTest::SetUp();
        if (const char* const obstacle = LoopDevice::obstacle())
            GTEST_SKIP() << obstacle;
        environment_["DBUS_SYSTEM_BUS_ADDRESS"] = "unix:path=/nonexistent/bus";
    }
    void TearDown() override
    {
        if (!device_.empty())
            runTool({"losetup", "-d", device_});
        ProgramTest::TearDown();
    }

    std::string device_;  ///< attached by the program, and not detached yet
};

TEST_F(DiskActionTest, AnImageIsAttachedMountedAndDetached)
{
    const auto image = makeVolume("\x1b[31mvolume.img", 8 * mebibyte, {"-L", "Fotos"});
    for (const std::string command : {"mount", "unmount", "eject", "detach"}) {
        const RunResult refused = run({command, image});
        EXPECT_EQ(refused.status, 8) << command;
        EXPECT_EQ(refused.output, "") << command;
        EXPECT_TRUE(refused.errors.starts_with("fixwell: cannot " + command + " “"))
            << refused.errors;
    }
    const RunResult attached = run({"attach", image});
    ASSERT_EQ(attached.status, 0) << attached.errors;
    ASSERT_TRUE(attached.output.starts_with("/dev/loop") && attached.output.ends_with('\n'));
    device_ = attached.output.substr(0, attached.output.size() - 1);

    const RunResult again = run({"attach", image});
    EXPECT_EQ(again.status, 8);
    EXPECT_NE(again.errors.find("it is attached already, as " + device_), std::string::npos);
    EXPECT_FALSE(holdsControls(again.errors));
    EXPECT_EQ(run({"verify", image}).status, 8) << "two would work on one volume";

    EXPECT_EQ(run({"mount", device_}).status, 8) << "nothing says where to";
    std::filesystem::create_directory(path("place"));
    std::ofstream(path("fstab")) << device_ << " " << path("place").native() << " ext4 ro 0 0\n";
    environment_["LIBMOUNT_FSTAB"] = path("fstab");
    const RunResult mounted = run({"mount", "--json", device_});
    EXPECT_EQ(mounted.status, 0) << mounted.errors;
    EXPECT_NE(mounted.output.find("\"place\":\"" + path("place").native() + "\""),
              std::string::npos)
        << mounted.output;

    const RunResult detached = run({"detach", "--json", image});
    EXPECT_EQ(detached.status, 0) << detached.errors;
    const auto done = Events(detached.output).named("done");
    ASSERT_EQ(done.size(), 1U) << detached.output;
    EXPECT_EQ(done.front()["disk"], image.native()) << "as the user named it";
    EXPECT_EQ(done.front()["message"], "“Fotos” was detached.");
    device_.clear();
    EXPECT_EQ(run({"verify", image}).status, 0);
}

}  // namespace
}  // namespace orvane::test
