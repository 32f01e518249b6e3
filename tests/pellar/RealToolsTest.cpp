// SPDX-License-Identifier: Apache-2.0
//
// The real tools on real volumes, damaged on purpose. A tool that is not installed is named, and
// its cases are skipped.

#include "contract/pellar/ErrorCodes.h"
#include "pellar/disks/LoopDevice.h"
#include "pellar/outcome/Outcome.h"
#include "pellar/process/Command.h"
#include "tests/pellar/JobFixture.h"
#include "tests/support/LoopDevice.h"
#include "tests/support/VolumeStates.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/ioctl.h>
#include <sys/mount.h>
#include <sys/stat.h>

#include <algorithm>
#include <fstream>

namespace {

using namespace pellar;
using orvane::test::contentsOf;
using orvane::test::Patch;
using orvane::test::VolumeMaker;
using orvane::test::VolumeState;

constexpr std::string_view toolPath = "/usr/sbin:/usr/bin:/sbin:/bin";

const VolumeMaker& makerOf(std::string_view filesystem)
{
    return *std::ranges::find(orvane::test::volumeMakers(), filesystem, &VolumeMaker::filesystem);
}

bool isInstalled(const VolumeMaker& maker)
{
    return !findProgram(maker.command.front(), toolPath).empty();
}

void patch(const std::filesystem::path& image, const std::vector<Patch>& patches)
{
    for (const Patch& p : patches)
        orvane::test::patch(image, p.offset, p.bytes);
}

std::filesystem::path make(const test::TestDirectory& directory, const VolumeState& state)
{
    const auto image = directory.makeVolume("disk", state.filesystem);
    patch(image, state.patches);
    if (!state.command.empty()) {
        std::vector<std::string> command = state.command;
        command.push_back(image);
        orvane::test::prepareWith(command);
    }
    return image;
}

using std::filesystem::last_write_time;

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
    const test::TestDirectory directory;
    const auto image = make(directory, state);
    const auto disk = test::reference(image, std::string(state.filesystem));
    test::JobFixture library;
    const auto before = last_write_time(image);
    ASSERT_EQ(library.verify(test::reference(image, "")), 0) << "its kind is not known";
    EXPECT_EQ(library.listener.verdict, state.verified) << library.listener.message;
    EXPECT_EQ(last_write_time(image), before) << "a verification wrote";
    EXPECT_EQ(library.listener.error == contract::kPLErrorDamagedForGood,
              state.verified == "damaged" && state.filesystem == "btrfs")
        << "nobody is sent to a repair that there is not";
    ASSERT_EQ(library.repair(disk), 0);
    EXPECT_EQ(library.listener.verdict, state.repaired)
        << state.because << ": " << library.listener.message;
    EXPECT_TRUE(state.verified == "damaged" || last_write_time(image) == before)
        << "a repair wrote to what is not known to be damaged";
    ASSERT_EQ(library.verify(disk), 0);
    EXPECT_EQ(library.listener.verdict, state.afterwards) << library.listener.message;
    EXPECT_EQ(library.listener.finished, 3);
    EXPECT_FALSE(library.listener.hasPlainLine("/proc/self")) << "our name for the disk is shown";
}

TEST_P(RealTools, AreTriedBeforeAnythingIsWrittenAndUndone)
{
    constexpr Task undo{Subject::Filesystem, Operation::Undo};
    const VolumeState& state = GetParam();
    const test::TestDirectory directory;
    const auto image = make(directory, state);
    const auto disk = test::reference(image, std::string(state.filesystem));
    const std::string before = contentsOf(image);
    RepairPolicy policy;
    test::JobFixture library(test::tryingIn(directory.path("repairs"), &policy));
    policy.isPreview = true;
    policy.keptImage = directory.path("kept");
    ASSERT_EQ(library.repair(disk), 0);
    EXPECT_TRUE(contentsOf(image) == before) << "a preview wrote";
    policy = {};
    ASSERT_EQ(library.repair(disk), 0);
    const bool isRepaired = library.listener.verdict == "repaired";
    EXPECT_EQ(isRepaired, contentsOf(image) != before) << library.listener.message;
    EXPECT_TRUE(!isRepaired || contentsOf(directory.path("kept")) == contentsOf(image))
        << "the preview shows another repair";
    EXPECT_TRUE(isRepaired || state.repaired != "repaired") << library.listener.message;
    ASSERT_EQ(library.verify(disk), 0);
    EXPECT_TRUE(!isRepaired || library.listener.verdict == "sound") << library.listener.message;
    ASSERT_EQ(library.run(undo, disk), 0);
    EXPECT_EQ(library.listener.verdict, isRepaired ? "undone" : "failed")
        << library.listener.message;
    EXPECT_TRUE(contentsOf(image) == before) << "it is not as it was";
}

INSTANTIATE_TEST_SUITE_P(EachState, RealTools, ::testing::ValuesIn(orvane::test::volumeStates()),
                         caseName);

/// A tool must never be let loose on what is not its own, whatever the disk is listed as.
TEST(RealToolsOnOthers, NeverWrite)
{
    for (const VolumeMaker& maker : orvane::test::volumeMakers()) {
        if (!isInstalled(maker))
            continue;
        const test::TestDirectory directory;
        const auto image = directory.makeVolume("disk", maker.filesystem);
        const auto before = last_write_time(image);
        for (const VolumeMaker& other : orvane::test::volumeMakers()) {
            if (other.filesystem == maker.filesystem)
                continue;
            test::JobFixture library;
            ASSERT_EQ(library.repair(test::reference(image, std::string(other.filesystem))), 0);
            EXPECT_EQ(library.listener.verdict, "failed")
                << maker.filesystem << " as " << other.filesystem;
            EXPECT_TRUE(last_write_time(image) == before)
                << other.filesystem << " wrote to " << maker.filesystem;
        }
    }
}

bool isOnALoopDevice(const std::filesystem::path& image)
{
    struct stat status = {};
    return ::stat(image.c_str(), &status) != 0 ||
           !loopDeviceOn(status.st_dev, status.st_ino, SystemPaths()).empty();
}

/// The volume, moved into the middle of a larger file.
contract::DiskReferencePointer embed(const test::TestDirectory& directory,
                                     const std::filesystem::path& volume,
                                     std::string_view filesystem)
{
    constexpr std::uint64_t margin = 1U << 20U;
    std::ifstream from(volume, std::ios::binary);
    std::ofstream(directory.path("whole"), std::ios::binary)
        << std::string(margin, 'm') << from.rdbuf() << std::string(margin, 'm');
    auto region = *test::reference(directory.path("whole"), std::string(filesystem));
    region.offset = margin;
    region.length -= 2 * margin;
    return std::make_shared<contract::DiskReference>(region);
}

void expectUntouchedMargins(const contract::DiskReference& disk)
{
    std::ifstream whole(disk.path, std::ios::binary);
    std::string margin(1U << 20U, '\0');
    for (const std::uint64_t at : {std::uint64_t{0}, disk.offset + disk.length}) {
        whole.seekg(static_cast<std::streamoff>(at))
            .read(margin.data(), static_cast<std::streamsize>(margin.size()));
        EXPECT_EQ(margin.find_first_not_of('m'), std::string::npos) << "beside the volume";
    }
}

TEST(RealToolsInAnImage, WorkOnARegionAndLeaveNoLoopDevice)
{
    const bool mayUseThem = orvane::test::LoopDevice::obstacle() == nullptr;
    for (const VolumeState& state : orvane::test::volumeStates()) {
        if (state.repaired != "repaired" || !isInstalled(makerOf(state.filesystem)))
            continue;
        const test::TestDirectory directory;
        const auto disk = embed(directory, make(directory, state), state.filesystem);
        test::JobFixture library;
        ASSERT_EQ(library.repair(disk), 0);
        EXPECT_EQ(library.listener.verdict, mayUseThem ? "repaired" : "failed")
            << state.filesystem << ", " << state.state << ": " << library.listener.message;
        EXPECT_TRUE(mayUseThem ||
                    test::contains(library.listener.message, "only an administrator"));
        EXPECT_FALSE(isOnALoopDevice(disk->path));
        expectUntouchedMargins(*disk);
    }
}

/// Writes to a volume that is mounted nowhere, and takes it away in the middle of it, so that all
/// is still in its log. NO where the right to do that is missing.
bool leaveALog(const std::filesystem::path& image)
{
    const FileDescriptor file(::open(image.c_str(), O_RDWR | O_CLOEXEC));
    const auto loop =
        LoopDevice::attach(file.get(), 0, std::filesystem::file_size(image), Access::ReadWrite);
    if (!loop)
        return false;
    const std::string source = "/proc/self/fd/" + std::to_string(loop->descriptor());
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
    const test::TestDirectory directory;
    const auto image = directory.makeVolume("disk", "xfs");
    if (!leaveALog(image))
        GTEST_SKIP() << "needs the right to set up loop devices and to mount XFS";
    test::JobFixture library;
    ASSERT_EQ(library.verify(test::reference(image, "xfs")), 0);
    EXPECT_EQ(library.listener.verdict, "inconclusive") << library.listener.message;
    ASSERT_EQ(library.repair(test::reference(image, "xfs")), 0);
    EXPECT_EQ(library.listener.verdict, "repaired") << library.listener.message;
    EXPECT_EQ(library.listener.message,
              "repaired “Disk”: its journal was replayed; nothing else was wrong");
    ASSERT_EQ(library.verify(test::reference(image, "xfs")), 0);
    EXPECT_EQ(library.listener.verdict, "sound") << library.listener.message;
    EXPECT_FALSE(isOnALoopDevice(image));
}

/// A volume with a few files in it.
std::filesystem::path makeVolume(const test::TestDirectory& directory,
                                 std::vector<std::string> options)
{
    const auto image = directory.makeExt("disk", 16U << 20U, std::move(options));
    directory.write("content", std::string(3000, 'x'));
    for (int i = 0; i < 8; ++i)
        directory.damage(image,
                         "write " + directory.path("content").string() + " f" + std::to_string(i));
    return image;
}

struct ExtDamage {
    std::vector<std::string> commands;  ///< of debugfs
    std::vector<Patch> patches;
    std::string_view message;  ///< of the repair; empty: repaired, whatever it cost
};

// What a repair costs is said where everybody sees it, in numbers that are true.
const std::vector<ExtDamage> extDamages{
    {{"set_super_value free_blocks_count 1"}, {}, "no damage is left"},  // -n exits with 0
    {{"set_inode_field f5 links_count 9"}, {}, "no damage is left"},
    {{"clri f3"}, {}, "no damage is left, but 1 of 19 files is gone"},
    {{"unlink f3"}, {}, "no damage is left; 1 file is now in lost+found"},
    {{"unlink f3", "unlink f4"}, {}, "no damage is left; 2 files are now in lost+found"},
    {{"clri f1", "unlink f2", "set_super_value free_inodes_count 3"}, {}, ""},
    // A table of inodes full of nonsense.
    {{},
     {{134 << 10, std::string(300U << 10U, '\xA5')}},
     "no damage is left, but 8 of 19 files are gone"},
    {{}, {{1024, std::string(1024, '\0')}}, ""},  // only a backup superblock is left
    {{"feature needs_recovery"}, {}, "its journal was replayed; nothing else was wrong"},
};

TEST(RealE2fsck, FindsDamageAndRepairsIt)
{
    for (const ExtDamage& damage : extDamages) {
        SCOPED_TRACE(&damage - extDamages.data());
        const test::TestDirectory directory;
        // From e2fsprogs 1.47.1 on a new volume has one inode more, of the orphan file.
        const auto image = makeVolume(directory, {"-b", "1024", "-O", "^orphan_file"});
        test::JobFixture library;
        ASSERT_EQ(library.verify(test::reference(image)), 0);
        EXPECT_EQ(library.listener.verdict, "sound") << "before";
        EXPECT_TRUE(library.listener.hasPlainLine("The volume “Disk” appears to be OK.\n"));
        const std::string sound = contentsOf(image);
        ASSERT_EQ(library.repair(test::reference(image)), 0);
        EXPECT_EQ(library.listener.verdict, "sound");
        EXPECT_TRUE(contentsOf(image) == sound) << "a repair wrote to a sound volume";

        for (const std::string& command : damage.commands)
            directory.damage(image, command);
        patch(image, damage.patches);
        const bool isLost = !damage.patches.empty() && damage.patches.front().offset == 1024;
        const auto disk = test::reference(image, isLost ? "" : "ext4");
        const std::string before = contentsOf(image);
        const bool waits = test::contains(damage.message, "journal");
        ASSERT_EQ(library.verify(disk), 0);
        EXPECT_EQ(library.listener.verdict, waits ? "inconclusive" : "damaged");
        EXPECT_EQ(library.listener.textsOf(contract::kFsckError).empty(), waits);
        EXPECT_TRUE(contentsOf(image) == before) << "a verification wrote";

        ASSERT_EQ(library.repair(disk), 0);
        EXPECT_EQ(library.listener.verdict, "repaired");
        EXPECT_TRUE(library.listener.hasPlainLine("“Disk” was repaired successfully.\n"));
        if (!damage.message.empty()) {
            EXPECT_EQ(library.listener.message, "repaired “Disk”: " + std::string(damage.message));
            const auto warnings = library.listener.textsOf(contract::kFsckFail);
            const bool isLoss = test::contains(damage.message, " file");
            const bool hasWarned =
                !warnings.empty() && warnings.back() == asLine(library.listener.message);
            EXPECT_EQ(hasWarned, isLoss) << damage.message;
            EXPECT_EQ(library.listener.result.boolean(contract::kPLHasLosses), isLoss);
        }
        ASSERT_EQ(library.verify(disk), 0);
        EXPECT_EQ(library.listener.verdict, "sound") << "after";
        EXPECT_EQ(library.listener.finished, 5);
    }
}

TEST(RealE2fsck, APreviewTellsWhatBecomesOfFiles)
{
    const test::TestDirectory directory;
    const auto image = makeVolume(directory, {"-O", "^orphan_file"});
    directory.damage(image, "mkdir dir");
    directory.damage(image, "write " + directory.path("content").string() + " dir/deep");
    for (const char* const command :
         {"unlink f3", "set_inode_field f4 mode 0177777", "set_inode_field f5 size 1",
          "set_inode_field dir/deep size 100", "set_inode_field f6 flags 0x80000", "clri f7"})
        directory.damage(image, command);
    RepairPolicy policy;
    policy.isPreview = true;
    test::JobFixture library(test::tryingIn(directory.path("repairs"), &policy));
    ASSERT_EQ(library.repair(test::reference(image)), 0);
    EXPECT_EQ(library.listener.error, contract::kPLErrorDamaged) << library.listener.message;
    const auto isTold = [&library](std::string_view sentence) {
        return std::ranges::any_of(library.listener.dictionaries, [&](const auto& message) {
            return message.string(contract::kFsckMessageString) == sentence;
        });
    };
    EXPECT_TRUE(library.listener.hasPlainLine("In lost+found after the repair: “#15”, 3000 bytes"));
    EXPECT_TRUE(isTold("After the repair: no damage is left; 1 file is now in lost+found."));
    EXPECT_TRUE(isTold("“/f4” would be gone")) << "its size is nonsense, too";
    EXPECT_TRUE(isTold("“/f5” would have another size: 1 → 3072 bytes"));
    EXPECT_TRUE(isTold("“/dir/deep” would have another size: 100 → 3072 bytes"));
    EXPECT_EQ(std::ranges::count_if(library.listener.dictionaries,
                                    [](const auto& message) {
                                        return test::contains(
                                            message.string(contract::kFsckMessageString),
                                            "” would ");
                                    }),
              3)
        << "what was damaged already, or is only moved, is not told of";
}

TEST(RealE2fsck, WillNotRepairAVolumeWhoseEndIsMissing)
{
    const test::TestDirectory directory;
    const auto image = makeVolume(directory, {});
    std::filesystem::resize_file(image, 8U << 20U);
    const std::string before = contentsOf(image);
    test::JobFixture library;
    ASSERT_EQ(library.verify(test::reference(image)), 0);
    EXPECT_EQ(library.listener.verdict, "damaged");
    EXPECT_TRUE(library.listener.hasErrorWith("The volume is cut short"));
    EXPECT_EQ(library.listener.error, contract::kPLErrorCutShort) << "nobody is sent to a repair";
    EXPECT_FALSE(library.listener.hasPlainLine("needs to be repaired."));
    ASSERT_EQ(library.repair(test::reference(image)), 0);
    EXPECT_EQ(library.listener.error, contract::kPLErrorCutShort)
        << "nor called damaged after a repair";
    EXPECT_TRUE(contentsOf(image) == before) << "something was written";
}

TEST(RealE2fsck, SaysWhatIsNoFileSystem)
{
    const test::TestDirectory directory;
    directory.write("noise", std::string(1U << 20U, '\xA5'));
    directory.write("empty", {});
    for (const auto& [name, filesystem, error] :
         {std::tuple("noise", "", contract::kPLErrorUnsupported),
          {"empty", "ext4", contract::kPLErrorUnsupported},
          {"noise", "ext4", contract::kPLErrorDamaged}}) {
        test::JobFixture library;
        ASSERT_EQ(library.verify(test::reference(directory.path(name), filesystem)), 0);
        EXPECT_EQ(library.listener.error, error) << name << filesystem;
    }
}

TEST(RealE2fsck, WritesNoExtOverAnotherKind)
{
    const test::TestDirectory directory;
    const auto image = directory.makeExt("disk", 16U << 20U, {"-b", "1024"});
    // Made into a swap area, as mkswap(8) would: the backup superblocks are still there.
    patch(image, {{0, std::string(4096, '\0')},
                  {1024, std::string("\x01\0\0\0\xFF\x0F\0\0", 8)},
                  {4086, "SWAPSPACE2"}});
    const std::string before = contentsOf(image);
    test::JobFixture library;
    ASSERT_EQ(library.repair(test::reference(image)), 0);
    EXPECT_EQ(library.listener.error, contract::kPLErrorUnsupported);
    EXPECT_TRUE(contentsOf(image) == before) << "something was written";
}

}  // namespace
