// SPDX-License-Identifier: Apache-2.0
// Mounting, ejecting and attaching as root where there is no UDisks2.

#include "tests/support/LoopDevice.h"
#include "tests/support/TestDirectory.h"
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
    const auto image = makeVolume("\x1b[31mvolume.img");
    for (const std::string command : {"mount", "unmount", "eject", "detach"}) {
        const RunResult refused = run({command, image});
        EXPECT_EQ(refused.status, 8) << command;
        EXPECT_NE(refused.errors.find("cannot " + command), std::string::npos) << refused.errors;
    }
    const RunResult attached = run({"attach", image});
    ASSERT_EQ(attached.status, 0) << attached.errors;
    ASSERT_TRUE(attached.output.starts_with("/dev/loop") && attached.output.ends_with('\n'));
    device_ = attached.output.substr(0, attached.output.size() - 1);

    const RunResult again = run({"attach", image});
    EXPECT_NE(again.errors.find("it is attached already, as " + device_), std::string::npos);
    EXPECT_FALSE(holdsControls(again.errors));
    EXPECT_EQ(run({"verify", image}).status, 8) << "two would work on one volume";

    EXPECT_EQ(run({"mount", device_}).status, 8) << "nothing says where to";
    std::filesystem::create_directory(path("place"));
    std::ofstream(path("fstab")) << device_ << " " << path("place").native() << " ext4 ro 0 0\n";
    environment_["LIBMOUNT_FSTAB"] = path("fstab");
    const RunResult mounted = run({"mount", "--json", device_});
    EXPECT_EQ(mounted.status, 0) << mounted.errors;
    EXPECT_EQ(Events(mounted.output).named("done").at(0)["place"], path("place").native());

    const RunResult detached = run({"detach", "--json", image});
    EXPECT_EQ(detached.status, 0) << detached.errors;
    EXPECT_EQ(Events(detached.output).named("done").at(0)["disk"], image.native())
        << "as the user named it";
    device_.clear();
    EXPECT_EQ(run({"verify", image}).status, 0);
}

}  // namespace
}  // namespace orvane::test
