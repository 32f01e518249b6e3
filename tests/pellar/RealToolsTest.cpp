// SPDX-License-Identifier: Apache-2.0
//
// The real tools on real volumes, damaged on purpose; e2fsck has a file of its own. A tool that is
// not installed is named, and its cases are skipped.

#include "contract/pellar/ErrorCodes.h"
#include "pellar/disks/LoopDevice.h"
#include "pellar/process/Command.h"
#include "tests/pellar/Workshop.h"
#include "tests/support/VolumeStates.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/ioctl.h>
#include <sys/mount.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <fstream>

namespace {

using namespace pellar;
using orvane::test::Patch;
using orvane::test::VolumeMaker;
using orvane::test::VolumeState;

constexpr std::string_view toolPath = "/usr/sbin:/usr/bin:/sbin:/bin";

const VolumeMaker& makerOf(std::string_view filesystem)
{
    const auto& makers = orvane::test::volumeMakers();
    return *std::find_if(makers.begin(), makers.end(), [filesystem](const VolumeMaker& maker) {
        return maker.filesystem == filesystem;
    });
}

bool isInstalled(const VolumeMaker& maker)
{
    return !findProgram(maker.command.front(), toolPath).empty();
}

std::filesystem::path make(const test::Workshop& workshop, const VolumeMaker& maker)
{
    workshop.write("disk", {});
    std::filesystem::resize_file(workshop.path("disk"), maker.bytes);
    workshop.prepare(maker.command, workshop.path("disk"));
    return workshop.path("disk");
}

void patch(const std::filesystem::path& image, const std::vector<Patch>& patches,
           std::uint64_t offset = 0)
{
    std::fstream file(image, std::ios::in | std::ios::out | std::ios::binary);
    for (const Patch& p : patches)
        file.seekp(static_cast<std::streamoff>(offset + p.offset)) << p.bytes;
}

std::filesystem::path make(const test::Workshop& workshop, const VolumeState& state)
{
    const auto image = make(workshop, makerOf(state.filesystem));
    patch(image, state.patches);
    if (!state.command.empty())
        workshop.prepare(state.command, image);
    return image;
}

/// What was written since, by the clock of the file's contents.
timespec lastWriteOf(const std::filesystem::path& image)
{
    struct stat status = {};
    ::stat(image.c_str(), &status);
    return status.st_mtim;
}

bool isSame(const timespec& a, const timespec& b)
{
    return a.tv_sec == b.tv_sec && a.tv_nsec == b.tv_nsec;
}

std::string caseName(const ::testing::TestParamInfo<VolumeState>& info)
{
    std::string name = std::string(info.param.filesystem) + "_" + std::string(info.param.state);
    std::replace(name.begin(), name.end(), ' ', '_');
    return name;
}

class RealTools : public ::testing::TestWithParam<VolumeState> {
protected:
    void SetUp() override
    {
        const VolumeMaker& maker = makerOf(GetParam().filesystem);
        if (!isInstalled(maker))
            GTEST_SKIP() << maker.command.front() << " is not installed (package " << maker.package
                         << ")";
    }
};

TEST_P(RealTools, SayWhatIsTrue)
{
    const VolumeState& state = GetParam();
    const test::Workshop workshop;
    const auto image = make(workshop, state);
    const auto disk = test::reference(image, std::string(state.filesystem));
    test::Bench bench;
    const timespec before = lastWriteOf(image);
    ASSERT_EQ(bench.verify(disk), 0);
    EXPECT_EQ(bench.listener.verdict, state.verified) << bench.listener.message;
    EXPECT_TRUE(isSame(lastWriteOf(image), before)) << "a verification wrote";
    EXPECT_EQ(bench.listener.error == contract::kPLErrorDamagedForGood,
              state.verified == "damaged" && state.filesystem == "btrfs")
        << "nobody is sent to a repair that there is not";
    ASSERT_EQ(bench.repair(disk), 0);
    EXPECT_EQ(bench.listener.verdict, state.repaired)
        << state.because << ": " << bench.listener.message;
    EXPECT_TRUE(state.verified != "sound" || isSame(lastWriteOf(image), before))
        << "a repair wrote to a sound volume";
    ASSERT_EQ(bench.verify(disk), 0);
    EXPECT_EQ(bench.listener.verdict, state.afterwards) << bench.listener.message;
    EXPECT_EQ(bench.listener.finished, 3);
    EXPECT_FALSE(bench.listener.hasPlainLine("/proc/self")) << "our name for the disk is shown";
}

// Nobody has said what it is.
TEST_P(RealTools, FindTheKindByThemselves)
{
    const VolumeState& state = GetParam();
    const test::Workshop workshop;
    const auto image = make(workshop, state);
    test::Bench bench;
    ASSERT_EQ(bench.verify(test::reference(image, "")), 0);
    EXPECT_EQ(bench.listener.verdict, state.verified) << bench.listener.message;
}

INSTANTIATE_TEST_SUITE_P(EachState, RealTools, ::testing::ValuesIn(orvane::test::volumeStates()),
                         caseName);

/// A tool must never be let loose on what is not its own, whatever the disk is listed as.
TEST(RealToolsOnOthers, NeverWrite)
{
    for (const VolumeMaker& maker : orvane::test::volumeMakers()) {
        if (!isInstalled(maker))
            continue;
        const test::Workshop workshop;
        const auto image = make(workshop, maker);
        const timespec before = lastWriteOf(image);
        for (const VolumeMaker& other : orvane::test::volumeMakers()) {
            if (other.filesystem == maker.filesystem)
                continue;
            test::Bench bench;
            ASSERT_EQ(bench.repair(test::reference(image, std::string(other.filesystem))), 0);
            EXPECT_EQ(bench.listener.verdict, "failed")
                << maker.filesystem << " as " << other.filesystem;
            EXPECT_TRUE(isSame(lastWriteOf(image), before))
                << other.filesystem << " wrote to " << maker.filesystem;
        }
    }
}

bool mayUseLoopDevices(const test::Workshop& workshop)
{
    workshop.write("probe", std::string(4096, 'x'));
    const FileDescriptor file(::open(workshop.path("probe").c_str(), O_RDONLY | O_CLOEXEC));
    return std::holds_alternative<LoopDevice>(
        LoopDevice::attach(file.get(), 0, 4096, Access::ReadOnly));
}

bool isOnALoopDevice(const std::filesystem::path& image)
{
    struct stat status = {};
    return ::stat(image.c_str(), &status) != 0 ||
           !loopDeviceOn(status.st_dev, status.st_ino, SystemPaths()).empty();
}

/// The volume, moved into the middle of a larger file.
contract::DiskReferencePointer embed(const test::Workshop& workshop,
                                    const std::filesystem::path& volume,
                                    std::string_view filesystem)
{
    constexpr std::uint64_t margin = 1U << 20U;
    std::ifstream from(volume, std::ios::binary);
    std::ofstream(workshop.path("whole"), std::ios::binary)
        << std::string(margin, 'm') << from.rdbuf() << std::string(margin, 'm');
    auto region = *test::reference(workshop.path("whole"), std::string(filesystem));
    region.offset = margin;
    region.length -= 2 * margin;
    return std::make_shared<contract::DiskReference>(region);
}

TEST(RealToolsInAnImage, WorkOnARegionAndLeaveNoLoopDevice)
{
    const test::Workshop probe;
    const bool mayUseThem = mayUseLoopDevices(probe);
    for (const VolumeState& state : orvane::test::volumeStates()) {
        if (state.repaired != "repaired" || !isInstalled(makerOf(state.filesystem)))
            continue;
        const test::Workshop workshop;
        const auto disk = embed(workshop, make(workshop, state), state.filesystem);
        test::Bench bench;
        ASSERT_EQ(bench.repair(disk), 0);
        EXPECT_EQ(bench.listener.verdict, mayUseThem ? "repaired" : "failed")
            << state.filesystem << ", " << state.state << ": " << bench.listener.message;
        EXPECT_TRUE(mayUseThem ||
                    bench.listener.message.find("only an administrator") != std::string::npos)
            << bench.listener.message;
        EXPECT_FALSE(isOnALoopDevice(disk->path));
        std::ifstream whole(disk->path, std::ios::binary);
        std::string margin(1U << 20U, '\0');
        for (const std::uint64_t at : {std::uint64_t{0}, disk->offset + disk->length}) {
            whole.seekg(static_cast<std::streamoff>(at))
                .read(margin.data(), static_cast<std::streamsize>(margin.size()));
            EXPECT_EQ(margin.find_first_not_of('m'), std::string::npos) << "beside the volume";
        }
    }
}

/// Writes to a volume that is mounted nowhere, and takes it away in the middle of it, so that all
/// is still in its log. NO where the right to do that is missing.
bool leaveALog(const std::filesystem::path& image)
{
    const FileDescriptor file(::open(image.c_str(), O_RDWR | O_CLOEXEC));
    const auto loop =
        LoopDevice::attach(file.get(), 0, std::filesystem::file_size(image), Access::ReadWrite);
    if (!std::holds_alternative<LoopDevice>(loop))
        return false;
    const std::string source =
        "/proc/self/fd/" + std::to_string(std::get<LoopDevice>(loop).descriptor());
    const FileDescriptor context(::fsopen("xfs", FSOPEN_CLOEXEC));
    if (!context ||
        ::fsconfig(context.get(), FSCONFIG_SET_STRING, "source", source.c_str(), 0) != 0 ||
        ::fsconfig(context.get(), FSCONFIG_CMD_CREATE, nullptr, nullptr, 0) != 0)
        return false;
    const FileDescriptor mount(::fsmount(context.get(), FSMOUNT_CLOEXEC, 0));
    const FileDescriptor root(::openat(mount.get(), ".", O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    for (int i = 0; i < 20; ++i)
        FileDescriptor(::openat(root.get(), ("f" + std::to_string(i)).c_str(),
                                O_WRONLY | O_CREAT | O_CLOEXEC, 0600));
    constexpr unsigned long shutDown = _IOR('X', 125, std::uint32_t);  // xfs_io(8), shutdown
    const std::uint32_t afterTheLogIsWritten = 1;
    return ::ioctl(root.get(), shutDown, &afterTheLogIsWritten) == 0;
}

TEST(RealXfsLog, IsReplayedByMountingAndThenVerified)
{
    if (!isInstalled(makerOf("xfs")))
        GTEST_SKIP() << "mkfs.xfs is not installed (package xfsprogs)";
    const test::Workshop workshop;
    const auto image = make(workshop, makerOf("xfs"));
    if (!leaveALog(image))
        GTEST_SKIP() << "needs the right to set up loop devices and to mount XFS";
    test::Bench bench;
    ASSERT_EQ(bench.verify(test::reference(image, "xfs")), 0);
    EXPECT_EQ(bench.listener.verdict, "inconclusive") << bench.listener.message;
    ASSERT_EQ(bench.repair(test::reference(image, "xfs")), 0);
    EXPECT_EQ(bench.listener.verdict, "repaired") << bench.listener.message;
    EXPECT_EQ(bench.listener.message,
              "repaired “Disk”: its journal was replayed; nothing else was wrong");
    ASSERT_EQ(bench.verify(test::reference(image, "xfs")), 0);
    EXPECT_EQ(bench.listener.verdict, "sound") << bench.listener.message;
    EXPECT_FALSE(isOnALoopDevice(image));
}

}  // namespace
